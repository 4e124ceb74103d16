#include "pells/image/image_base.h"

#include <cstring>
#include <new>
#include <random>
#include <sstream>

#include "pells/image/image_loaders.h"
#include "pells/material/color.h"
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
            data[static_cast<std::size_t>(i)] = static_cast<unsigned char>(i);
    }
    using Image_base::init;
    using Image_base::makeBogusImage;
};

class GrayImage : public LibraryTest {
protected:
    bool load(const std::string& file) {
        std::istringstream in(file);
        return TGAFileLoader::loadTarga(&image, in);
    }

    Image_base image{1, 1};
};

const ImageFormat ownFormat = static_cast<ImageFormat>(7);

TEST(Pixels, ArePackedWithTheLowBitsDropped) {
    const struct {
        ImageFormat format;
        unsigned char bytes[4];
        std::vector<std::uint32_t> packed;  // ABGR, ARGB, A1R5G5B5, A4R4G4B4, A8R3G3B2, A2B10..
    } pixels[] = {
        {FMT_RGB, {255, 255, 255}, {~0U, ~0U, 0xFFFF, 0xFFFF, 0xFFFF, 0xFFCFF3FC}},
        {FMT_RGB, {255, 128, 0}, {0xFF0080FF, 0xFFFF8000, 0xFE00, 0xFF80, 0xFFF0, 0xC00803FC}},
        {FMT_RGBA,
         {255, 128, 0, 128},
         {0x800080FF, 0x80FF8000, 0xFE00, 0x8F80, 0x80F0, 0x800803FC}},
        {FMT_RGBA, {255, 0, 0, 127}, {0x7F0000FF, 0x7FFF0000, 0x7C00, 0x7F00, 0x7FE0, 0x400003FC}},
        {FMT_RGBA, {18, 52, 86, 120}, {0x78563412, 0x78123456, 0x08CA, 0x7135, 0x7805, 0x55834048}},
        {ownFormat, {18, 52, 86, 248}, {0, 0, 0x88CA, 0xF135, 0xF805, 0}},
    };
    for (const auto& each : pixels) {
        TestImage image(3, 2, each.format);
        const unsigned char* const bytes = each.bytes;
        ASSERT_TRUE(image.setColorAsARGB(1, 1, bytes[0], bytes[1], bytes[2], bytes[3]));
        const std::vector<std::uint32_t> packed = {
            image.getColorAsABGR(1, 1),     image.getColorAsARGB(1, 1),
            image.getColorAsA1R5G5B5(1, 1), image.getColorAsA4R4G4B4(1, 1),
            image.getColorAsA8R3G3B2(1, 1), image.getColorAsA2B10G10R10(1, 1)};
        EXPECT_EQ(packed, each.packed);
        EXPECT_EQ(image.getColorAsARGB(0.34, 0.999), packed[1]);
        EXPECT_EQ(image.getColorAsABGR(0.66, 0.5), packed[0]);

        unsigned char copy[4] = {};
        unsigned char* const alpha = each.format == FMT_RGB ? nullptr : copy + 3;
        image.getColorComponents(1, 1, copy, copy + 1, copy + 2, alpha);
        EXPECT_EQ(std::memcmp(copy, bytes, 4), 0);
    }
}

template <class Packed>
void expectRowOfPixels(const Image_base& image, int y,
                       void (Image_base::*rowGetter)(int, Packed*) const,
                       Packed (Image_base::*pixelGetter)(int, int) const) {
    const Packed untouched = 0x5A5A;
    std::vector<Packed> row(static_cast<std::size_t>(image.getWidth()) + 1, untouched);
    std::vector<Packed> expected = row;
    (image.*rowGetter)(y, row.data());
    for (int x = 0; x < image.getWidth(); ++x)
        expected[static_cast<std::size_t>(x)] = (image.*pixelGetter)(x, y);
    EXPECT_EQ(row, expected) << "width " << image.getWidth();
}

TEST(Pixels, AreTheSameInWholeRows) {
    std::mt19937 random(3);
    for (const pells::ImageFormat format : {FMT_RGB, FMT_RGBA, ownFormat}) {
        // Blocks of several pixels leave rests of every length.
        for (const int width : {0, 1, 2, 3, 4, 5, 6, 7, 8, 9, 17, 255, 256, 257, 1030}) {
            TestImage image(width, 3, format);
            for (int x = 0; x < width; ++x) {
                const auto bits = static_cast<std::uint32_t>(random());
                unsigned char c[4];
                std::memcpy(c, &bits, sizeof c);
                image.setColorAsARGB(x, 2, c[0], c[1], c[2], c[3]);
            }
            for (const int y : {0, 2}) {
                expectRowOfPixels<std::uint32_t>(image, y, &Image_base::getRowAsABGR,
                                                 &Image_base::getColorAsABGR);
                expectRowOfPixels<std::uint32_t>(image, y, &Image_base::getRowAsARGB,
                                                 &Image_base::getColorAsARGB);
                expectRowOfPixels(image, y, &Image_base::getRowAsA1R5G5B5,
                                  &Image_base::getColorAsA1R5G5B5);
                expectRowOfPixels(image, y, &Image_base::getRowAsA4R4G4B4,
                                  &Image_base::getColorAsA4R4G4B4);
                expectRowOfPixels(image, y, &Image_base::getRowAsA8R3G3B2,
                                  &Image_base::getColorAsA8R3G3B2);
                expectRowOfPixels(image, y, &Image_base::getRowAsA2B10G10R10,
                                  &Image_base::getColorAsA2B10G10R10);
            }
        }
    }
}

TEST(Pixels, AreSetInsideTheImageOnly) {
    TestImage image(2, 2, FMT_RGB);
    for (const auto& at : {std::pair<int, int>{-1, 0}, {0, -1}, {2, 0}, {0, 2}})
        EXPECT_FALSE(image.setColorAsARGB(at.first, at.second, 91, 92, 93, 94));
    EXPECT_TRUE(image.setColorAsARGB(0, 1, 91, 92, 93, 94));
    EXPECT_EQ(std::memcmp(image.getData(), "\0\1\2\3\4\5\x5B\x5C\x5D\x9\xA\xB", 12), 0);
}

TEST(Images, FlipAroundTheMiddleRowAndCheckTheirSizes) {
    TestImage image(1, 3, FMT_RGB);
    image.flipVertically();
    EXPECT_EQ(std::memcmp(image.getData(), "\6\7\10\3\4\5\0\1\2", 9), 0);
    EXPECT_TRUE(Image_base(2, 256).dimensionsArePowerOfTwo());
    EXPECT_TRUE(Image_base(0, 0).dimensionsArePowerOfTwo());
    EXPECT_FALSE(Image_base(3, 4).dimensionsArePowerOfTwo());
    EXPECT_THROW(Image_base(-1, 1), std::bad_alloc);
    EXPECT_THROW(Image_base(0x7FFFFFFF, 0x7FFFFFFF), std::bad_alloc);
}

TEST(Images, BecomeTheSubstituteAndEmptyAgain) {
    TestImage image(5, 1, FMT_RGB);
    image.makeBogusImage();
    EXPECT_TRUE(image.isBogusImage());
    EXPECT_EQ(image.getFormat(), FMT_RGBA);
    ASSERT_EQ(image.getWidth() * image.getHeight() * image.getNumComponents(), 16);
    EXPECT_EQ(std::memcmp(image.getData(), "\xFF\0\0\xFF\0\xFF\0\xFF\xFF\0\0\xFF\0\xFF\0\xFF", 16),
              0);
    image.clearImage();
    EXPECT_TRUE(image.isBogusImage()) << "clearing keeps the flags";
    EXPECT_FALSE(image.isValid());
    EXPECT_EQ(image.getWidth() + image.getHeight() + image.getNumComponents(), 0);
    image.init();
    EXPECT_FALSE(image.isBogusImage());
}

TEST_F(GrayImage, GetsTheSameBytesAsPixelByPixel) {
    const int side = 32;
    std::string file = tgaHeader(side, side, 8);
    for (int i = 0; i < side * side; ++i)
        file += static_cast<char>(i);
    ASSERT_TRUE(load(file));
    for (int i = 0; i < 256 * 3; ++i)
        ASSERT_EQ(image.getData()[i], i / 3) << "black to white keeps the level";

    std::mt19937 random(7);
    for (int round = 0; round < 50; ++round) {
        unsigned char c[6];
        float unit[6];
        for (int k = 0; k < 6; ++k) {
            c[k] = static_cast<unsigned char>(random());
            unit[k] = static_cast<float>(c[k] * (1.0 / 255.0));
        }
        image.colorize(c[0], c[1], c[2], c[3], c[4], c[5]);
        RGBtoHSV(unit[0], unit[1], unit[2], unit[0], unit[1], unit[2]);
        RGBtoHSV(unit[3], unit[4], unit[5], unit[3], unit[4], unit[5]);
        for (int i = 0; i < side * side; ++i) {
            const float t = static_cast<float>(i & 0xFF) * (1.0F / 255.0F);
            const Color hsv =
                HSVInterpolate(unit[0], unit[1], unit[2], unit[3], unit[4], unit[5], t);
            float rgb[3];
            HSVtoRGB(hsv.r, hsv.g, hsv.b, rgb[0], rgb[1], rgb[2]);
            for (int k = 0; k < 3; ++k)
                ASSERT_EQ(image.getData()[i * 3 + k], static_cast<int>(rgb[k] * 255.0)) << i;
        }
    }
}

TEST_F(GrayImage, ThatWasFilledAnewIsColoredWhereBothPicturesHavePixels) {
    ASSERT_TRUE(load(tgaFile(3, 1, 8)));
    ASSERT_TRUE(load(tgaFile(2, 2, 32)));
    const std::string last(reinterpret_cast<const char*>(image.getData()) + 12, 4);
    image.colorize(9, 9, 9, 9, 9, 9);
    EXPECT_EQ(image.getColorAsARGB(0, 1), 0xFF090909U);
    EXPECT_EQ(std::memcmp(image.getData() + 12, last.data(), 4), 0);

    ASSERT_TRUE(load(tgaFile(1, 1, 24)));
    image.colorize(8, 8, 8, 8, 8, 8);
    EXPECT_EQ(image.getColorAsARGB(0, 0), 0xFF080808U);
    ASSERT_FALSE(load(tgaFile(1, 1, 24).substr(0, 19)));
    image.colorize(8, 8, 8, 8, 8, 8);
    image.flipVertically();
    EXPECT_FALSE(image.setColorAsARGB(0, 0, 1, 1, 1, 1)) << "a size without pixels";
}

TEST(HeaderNumbers, AreLittleEndian) {
    unsigned char bytes[4] = {};
    Image_base::setInt(bytes, 0x51234);
    EXPECT_EQ(Image_base::getLong(bytes), 0x1234);
    Image_base::setLong(bytes, -2);
    EXPECT_EQ(Image_base::getLong(bytes), -2);
    EXPECT_EQ(Image_base::getInt(bytes), 0xFFFE);
    Image_base::setCharValue(bytes, 0x1FF);
    EXPECT_EQ(Image_base::getCharValue(bytes), 255);
}

}  // namespace
