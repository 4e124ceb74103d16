#include "pells/image/image_base.h"

#include <cstring>
#include <new>
#include <sstream>
#include <utility>
#include <vector>

#include "pells/image/image_loaders.h"
#include "support/test_prefs.h"
#include "support/tga_file.h"

namespace {

using namespace pells;
using namespace pells_test;

/// An image that a derived class fills.
class TestImage : public Image_base {
public:
    TestImage(int pixelsWide, int pixelsHigh, ImageFormat pixelFormat)
        : Image_base(pixelsWide, pixelsHigh) {
        format = pixelFormat;
        numComponents = pixelFormat == FMT_RGB ? 3 : 4;
        for (int i = 0; i < width * height * numComponents; ++i)
            data[static_cast<std::size_t>(i)] = static_cast<unsigned char>(i * 89 + i / 251);
    }
    using Image_base::makeBogusImage;
};

const ImageFormat ownFormat = static_cast<ImageFormat>(7);

typedef std::vector<std::uint32_t> Packed;

Packed packed(const Image_base& image, int x, int y) {
    return {image.getColorAsABGR(x, y),        image.getColorAsARGB(x, y),
            image.getColorAsA2B10G10R10(x, y), image.getColorAsA1R5G5B5(x, y),
            image.getColorAsA4R4G4B4(x, y),    image.getColorAsA8R3G3B2(x, y)};
}

TEST(Pixels, ArePackedWithTheLowBitsDropped) {
    const struct {
        ImageFormat format;
        unsigned char bytes[4];
        Packed packed;
    } pixels[] = {
        {FMT_RGB, {255, 128, 0}, {0xFF0080FF, 0xFFFF8000, 0xC00803FC, 0xFE00, 0xFF80, 0xFFF0}},
        {FMT_RGBA, {255, 0, 0, 127}, {0x7F0000FF, 0x7FFF0000, 0x400003FC, 0x7C00, 0x7F00, 0x7FE0}},
        {FMT_RGBA, {18, 52, 86, 128}, {0x80563412, 0x80123456, 0x95834048, 0x88CA, 0x8135, 0x8005}},
        {ownFormat, {18, 52, 86, 248}, {0, 0, 0, 0x88CA, 0xF135, 0xF805}},
    };
    for (const auto& each : pixels) {
        TestImage image(4, 3, each.format);
        const unsigned char* const bytes = each.bytes;
        ASSERT_TRUE(image.setColorAsARGB(2, 1, bytes[0], bytes[1], bytes[2], bytes[3]));
        EXPECT_EQ(packed(image, 2, 1), each.packed);
        EXPECT_EQ(image.getColorAsABGR(0.5, 0.34), each.packed[0]);
        EXPECT_EQ(image.getColorAsARGB(0.74, 0.66), each.packed[1]);

        unsigned char copy[4] = {};
        unsigned char* const alpha = each.format == FMT_RGB ? nullptr : copy + 3;
        image.getColorComponents(2, 1, copy, copy + 1, copy + 2, alpha);
        EXPECT_EQ(std::memcmp(copy, bytes, 4), 0);
    }
}

TEST(Pixels, AreTheSameInWholeRows) {
    for (const ImageFormat format : {FMT_RGB, FMT_RGBA, ownFormat}) {
        // Blocks of several pixels leave rests of every length.
        for (const std::size_t width : {0u, 1u, 2u, 3u, 4u, 5u, 7u, 8u, 9u, 17u, 257u, 1030u}) {
            const TestImage image(static_cast<int>(width), 2, format);
            std::vector<std::uint32_t> abgr(width), argb(width), a2b10(width);
            std::vector<std::uint16_t> a1r5(width), a4r4(width), a8r3(width);
            image.getRowAsABGR(1, abgr.data());
            image.getRowAsARGB(1, argb.data());
            image.getRowAsA2B10G10R10(1, a2b10.data());
            image.getRowAsA1R5G5B5(1, a1r5.data());
            image.getRowAsA4R4G4B4(1, a4r4.data());
            image.getRowAsA8R3G3B2(1, a8r3.data());
            for (std::size_t x = 0; x < width; ++x) {
                const Packed inRow = {abgr[x], argb[x], a2b10[x], a1r5[x], a4r4[x], a8r3[x]};
                ASSERT_EQ(inRow, packed(image, static_cast<int>(x), 1)) << x << " of " << width;
            }
        }
    }
}

TEST(Images, AreSetInsideAndFlippedAroundTheMiddleRow) {
    TestImage image(1, 3, FMT_RGB);
    for (const auto& at : {std::pair<int, int>{-1, 1}, {0, -1}, {1, 0}, {0, 3}})
        EXPECT_FALSE(image.setColorAsARGB(at.first, at.second, 91, 92, 93, 94));
    EXPECT_TRUE(image.setColorAsARGB(0, 1, 91, 92, 93, 94));
    image.flipVertically();
    EXPECT_EQ(std::memcmp(image.getData(), "\x16\x6F\xC8[\\]\x00\x59\xB2", 9), 0);
}

TEST(Images, CheckTheirSizes) {
    EXPECT_TRUE(Image_base(2, 256).dimensionsArePowerOfTwo());
    EXPECT_FALSE(Image_base(3, 4).dimensionsArePowerOfTwo());
    EXPECT_THROW(Image_base(-1, 1), std::bad_alloc);
    EXPECT_THROW(Image_base(0x7FFFFFFF, 0x7FFFFFFF), std::bad_alloc);
}

TEST(Images, BecomeTheSubstituteAndEmptyAgain) {
    TestImage image(5, 1, FMT_RGB);
    image.makeBogusImage();
    EXPECT_EQ(image.getFormat(), FMT_RGBA);
    ASSERT_EQ(image.getWidth() * image.getHeight() * image.getNumComponents(), 16);
    for (const int row : {0, 8})
        EXPECT_EQ(std::memcmp(image.getData() + row, "\xFF\0\0\xFF\0\xFF\0\xFF", 8), 0);
    image.clearImage();
    EXPECT_TRUE(image.isBogusImage()) << "clearing keeps the flags";
    EXPECT_FALSE(image.isValid());
    EXPECT_EQ(image.getWidth() + image.getHeight() + image.getNumComponents(), 0);
}

class GrayImage : public LibraryTest {
protected:
    bool load(const std::string& file) {
        std::istringstream in(file);
        return TGAFileLoader::loadTarga(&image, in);
    }

    Image_base image{1, 1};
};

TEST_F(GrayImage, IsColoredLevelByLevel) {
    std::string file = tgaHeader(256, 1, 8);
    for (int level = 0; level < 256; ++level)
        file += static_cast<char>(level);
    ASSERT_TRUE(load(file));
    for (int i = 0; i < 256 * 3; ++i)
        ASSERT_EQ(image.getData()[i], i / 3) << "black to white keeps the level";
    image.colorize(255, 51, 0, 0, 102, 204);
    const std::pair<int, std::uint32_t> colors[] = {
        {0, 0xFFFF3200}, {1, 0xFFFE3000}, {100, 0xFFEB00A9}, {128, 0xFFE400E5}, {255, 0xFF0066CC}};
    for (const auto& each : colors)
        EXPECT_EQ(image.getColorAsARGB(each.first, 0), each.second) << each.first;
}

TEST_F(GrayImage, ThatWasFilledAnewIsColoredWhereBothPicturesHavePixels) {
    ASSERT_TRUE(load(tgaFile(3, 1, 8)));
    ASSERT_TRUE(load(tgaFile(2, 2, 32)));
    const std::uint32_t last = image.getColorAsARGB(1, 1);
    image.colorize(9, 9, 9, 9, 9, 9);
    EXPECT_EQ(image.getColorAsARGB(0, 1), 0xFF090909U);
    EXPECT_EQ(image.getColorAsARGB(1, 1), last);

    ASSERT_FALSE(load(tgaFile(1, 1, 24).substr(0, 19)));
    image.colorize(8, 8, 8, 8, 8, 8);
    image.flipVertically();
    EXPECT_FALSE(image.setColorAsARGB(0, 0, 1, 1, 1, 1)) << "a size without pixels";
}

TEST(HeaderNumbers, AreLittleEndian) {
    unsigned char bytes[4];
    Image_base::setLong(bytes, -0x1234568);
    EXPECT_EQ(Image_base::getLong(bytes), -0x1234568);
    Image_base::setInt(bytes, 0x51234);
    Image_base::setCharValue(bytes, 0x1FF);
    EXPECT_EQ(Image_base::getInt(bytes), 0x12FF);
    EXPECT_EQ(Image_base::getCharValue(bytes), 255);
}

struct Emptied : pells::Image_base {
    using Image_base::Image_base;
    using Image_base::init;
};

TEST(Image, IsEmptyAfterInit) {
    Emptied image(3, 2);
    image.init();
    EXPECT_FALSE(image.isValid());
    EXPECT_EQ(image.getWidth() + image.getHeight() + image.getNumComponents(), 0);
    image.colorize(0, 0, 0, 255, 255, 255);
    EXPECT_FALSE(image.isGrayscale());
}

}  // namespace
