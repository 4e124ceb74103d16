#include <cstdlib>
#include <fstream>
#include <sstream>
#include <stdexcept>

#include "pells/image/image_base.h"
#include "pells/image/image_loaders.h"
#include "support/chunked_buffer.h"
#include "support/test_prefs.h"
#include "support/tga_file.h"

namespace {

using pells::Image_base;
using pells::TGAFileLoader;
using namespace pells_test;

/// Hands out a few bytes at a time, knows no end and cannot seek; a damaged one throws in the end.
class SlowStream : public std::istream {
public:
    explicit SlowStream(const std::string& file, bool damaged = false)
        : std::istream(nullptr), bytes(file), buffer(bytes, 1000, damaged) {
        rdbuf(&buffer);
        exceptions(std::ios_base::badbit);
    }

private:
    std::string bytes;
    ChunkedBuffer buffer;
};

class Tga : public LibraryTest {
protected:
    bool load(const std::string& file) {
        std::istringstream in(file);
        return TGAFileLoader::loadTarga(&image, in);
    }

    std::string pixels() {
        const int size = image.getWidth() * image.getHeight() * image.getNumComponents();
        return std::string(reinterpret_cast<const char*>(image.getData()),
                           static_cast<std::size_t>(size));
    }

    Image_base image{1, 1};
};

/// What a file's pixels should look like in memory.
std::string shown(const std::string& file, int width, int height, int depth, bool topFirst) {
    std::string rows;
    for (int y = 0; y < height; ++y) {
        const int row = topFirst ? y : height - 1 - y;
        const char* pixel = &file[18] + row * width * depth / 8;
        for (int x = 0; x < width; ++x, pixel += depth / 8) {
            const bool gray = depth == 8;
            rows += {pixel[gray ? 0 : 2], pixel[gray ? 0 : 1], pixel[0]};
            if (depth == 32)
                rows += pixel[3];
        }
    }
    return rows;
}

TEST_F(Tga, IsReadWhateverItsDepthItsRowOrderAndItsStream) {
    const std::pair<int, int> sizes[] = {{1, 1},     {5, 3}, {6, 2}, {200, 300},
                                         {20000, 3}, {0, 9}, {9, 0}};
    for (const auto& size : sizes) {
        for (const int depth : {8, 24, 32, -8, -24, -32}) {  // negative: bottom first
            const int bits = std::abs(depth);
            SCOPED_TRACE(testing::Message() << size.first << "x" << size.second << "x" << depth);
            std::string file = tgaFile(size.first, size.second, bits, depth > 0 ? 0x28 : 0x08);
            const std::string expected = shown(file, size.first, size.second, bits, depth > 0);
            file[0] = '\xFF';
            file.insert(18, 255, 'i');
            std::istringstream quick(file + "rest");
            std::ifstream fromDisk(scratch.write("a.tga", file), std::ios_base::binary);
            SlowStream slow(file);
            for (std::istream* const in :
                 {static_cast<std::istream*>(&quick), static_cast<std::istream*>(&fromDisk),
                  static_cast<std::istream*>(&slow)}) {
                ASSERT_TRUE(TGAFileLoader::loadTarga(&image, *in));
                EXPECT_TRUE(pixels() == expected);
                EXPECT_EQ(image.getWidth(), size.first);
                EXPECT_EQ(image.getHeight(), size.second);
                EXPECT_EQ(image.getFormat(), bits == 32 ? pells::FMT_RGBA : pells::FMT_RGB);
                EXPECT_TRUE(image.isGrayscale()) << "once grey, for good";
            }
            EXPECT_EQ(quick.get(), 'r') << "nothing is read after the last row";
        }
    }
}

TEST_F(Tga, IsRefusedWithItsReason) {
    EXPECT_TRUE(load(tgaFile(1, 1, 24, 0x28)));
    EXPECT_TRUE(load(tgaFile(1, 1, 24, 0xCF)));
    EXPECT_EQ(logLines("paint: "),
              (Lines{"loadTarga(): descriptor value 28, image is top first",
                     "loadTarga(): descriptor value cf, image is bottom first"}));
    std::string mapped = tgaFile(2, 2, 24);
    mapped[1] = 1;
    std::string cutId = tgaHeader(2, 2, 24);
    cutId[0] = 3;
    const struct {
        std::string file;
        const char* line;
        int side;  // what the image says afterwards
        int components;
        bool grayscale;
    } cases[] = {
        {"", "tga file shorter than header (0 bytes)", 0, 0, false},
        {tgaHeader(2, 2, 24).substr(0, 10), "tga file shorter than header (10 bytes)", 0, 0, false},
        {mapped, "bad colormap value 1", 0, 0, false},
        {cutId + "id", "tga file ends inside id info", 0, 0, false},
        {tgaFile(2, 2, 16), "unsupported pixel depth 16", 0, 0, false},
        {tgaFile(2, 2, 0), "unsupported pixel depth 0", 0, 0, false},
        {tgaHeader(2, 2, 24) + "12345678901", "tga file shorter than data", 2, 3, false},
        {tgaHeader(2, 2, 32), "tga file shorter than data", 2, 4, false},
        {tgaHeader(2, 2, 8) + "123", "tga file shorter than data", 2, 3, true},
    };
    for (const auto& each : cases) {
        SCOPED_TRACE(each.line);
        EXPECT_FALSE(load(each.file));
        EXPECT_EQ(logLines("error: ").back(), each.line);
        EXPECT_EQ(image.getData(), nullptr);
        EXPECT_EQ(image.getWidth(), each.side);
        EXPECT_EQ(image.getHeight(), each.side);
        EXPECT_EQ(image.getNumComponents(), each.components);
        EXPECT_EQ(image.isGrayscale(), each.grayscale);
    }
    const std::uint64_t limit = TGAFileLoader::maximumPixels();
    EXPECT_EQ(limit, std::uint64_t{16384} * 16384);
    TGAFileLoader::setMaximumPixels(35);
    for (const int depth : {8, 24, 32}) {
        EXPECT_TRUE(load(tgaFile(5, 7, depth)));
        EXPECT_FALSE(load(tgaFile(6, 6, depth)));
        EXPECT_EQ(logLines("error: ").back(), "tga image too large");
    }
    TGAFileLoader::setMaximumPixels(limit);
    std::istringstream in(tgaFile(1, 1, 24));
    EXPECT_FALSE(TGAFileLoader::loadTarga(nullptr, in));
    EXPECT_EQ(in.tellg(), 0);
    EXPECT_EQ(logLines("error: ").back(), "can't load TGA into NULL Image");
    EXPECT_EQ(logLines("error: ").size(), std::size(cases) + 4);
}

TEST_F(Tga, MayEndOrThrowAtEveryByte) {
    for (const int depth : {8, 24, 32}) {
        std::string file = tgaFile(3, 5, depth);
        file[0] = 2;
        file.insert(18, "id");
        for (std::size_t size = 0; size < file.size(); ++size) {
            SCOPED_TRACE(testing::Message() << size << " bytes, depth " << depth);
            const std::string cut = file.substr(0, size);
            EXPECT_FALSE(load(cut));
            EXPECT_FALSE(image.isValid());
            ChunkedBuffer silent(cut, 7, true);
            std::istream in(&silent);
            EXPECT_FALSE(TGAFileLoader::loadTarga(&image, in)) << "the stream swallows the error";
            EXPECT_FALSE(image.isValid());
            SlowStream loud(cut, true);
            EXPECT_THROW(TGAFileLoader::loadTarga(&image, loud), std::runtime_error);
            EXPECT_FALSE(image.isValid());
            image.colorize(1, 2, 3, 4, 5, 6);
        }
        EXPECT_TRUE(load(file));
        EXPECT_TRUE(pixels() == shown(tgaFile(3, 5, depth), 3, 5, depth, true));
    }
}

TEST_F(Tga, SurvivesEveryFlippedBitOfItsHeader) {
    for (const int depth : {8, 24, 32}) {
        const std::string file = tgaFile(3, 5, depth);
        for (std::size_t bit = 0; bit < 144; ++bit) {
            std::string flipped = file;
            flipped[bit / 8] = static_cast<char>(flipped[bit / 8] ^ (1 << bit % 8));
            const bool loaded = load(flipped);
            EXPECT_EQ(loaded, image.isValid()) << bit;
            EXPECT_LE(image.isValid() ? pixels().size() : 0, file.size() * 3) << bit;
        }
    }
}

TEST_F(Tga, WhoseStreamThrowsFarInsideLeavesTheImageUsable) {
    const std::string file = tgaFile(300, 200, 24);
    for (const std::size_t delivered : {1000U, 59000U}) {
        SlowStream in(file.substr(0, delivered), true);
        EXPECT_THROW(TGAFileLoader::loadTarga(&image, in), std::runtime_error);
        EXPECT_FALSE(image.isValid());
    }
    EXPECT_TRUE(load(file));
    EXPECT_TRUE(pixels() == shown(file, 300, 200, 24, true));
}

}  // namespace
