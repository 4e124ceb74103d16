#include <gtest/gtest.h>

#include <cstdlib>
#include <fstream>
#include <new>
#include <sstream>
#include <stdexcept>
#include <vector>

#include "pells/image/image_base.h"
#include "pells/image/image_loaders.h"
#include "support/chunked_buffer.h"
#include "support/test_prefs.h"
#include "support/tga_file.h"

namespace {

/// In arrays, which is what pixels are kept in.
std::size_t allocatedBytes = 0;

}  // namespace

void* operator new[](std::size_t size, const std::nothrow_t& /*tag*/) noexcept {
    allocatedBytes += size;
    return std::malloc(size == 0 ? 1 : size);
}
void* operator new[](std::size_t size) {
    if (void* const memory = operator new[](size, std::nothrow))
        return memory;
    throw std::bad_alloc();
}
void operator delete[](void* memory) noexcept {
    std::free(memory);
}
void operator delete[](void* memory, std::size_t /*size*/) noexcept {
    std::free(memory);
}

namespace {

using pells::Image_base;
using pells::TGAFileLoader;
using pells_test::tgaFile;
using pells_test::tgaHeader;

/// Throws where its bytes end.
class DamagedBuffer : public pells_test::ChunkedBuffer {
public:
    using ChunkedBuffer::ChunkedBuffer;

private:
    int_type underflow() override {
        const int_type next = ChunkedBuffer::underflow();
        if (next == traits_type::eof())
            throw std::runtime_error("damaged");
        return next;
    }
};

/// Hands out a few bytes at a time, knows no end and cannot seek; a damaged one throws in the end.
class SlowStream : public std::istream {
public:
    explicit SlowStream(const std::string& file, bool isDamaged = false)
        : std::istream(nullptr), bytes(file), good(bytes, 1000), damaged(bytes, 1000) {
        rdbuf(isDamaged ? &damaged : &good);
        exceptions(std::ios_base::badbit);
    }

private:
    std::string bytes;
    pells_test::ChunkedBuffer good;
    DamagedBuffer damaged;
};

class Tga : public pells_test::LibraryTest {
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
    const std::size_t step = static_cast<std::size_t>(depth / 8);
    std::string rows;
    for (int y = 0; y < height; ++y) {
        for (int x = 0; x < width; ++x) {
            const int row = topFirst ? y : height - 1 - y;
            const std::string pixel =
                file.substr(18 + static_cast<std::size_t>(row * width + x) * step, step);
            if (step == 1)
                rows.append(3, pixel[0]);
            else
                rows += {pixel[2], pixel[1], pixel[0]};
            if (step == 4)
                rows += pixel[3];
        }
    }
    return rows;
}

TEST_F(Tga, IsReadWhateverItsDepthItsRowOrderAndItsStream) {
    const std::pair<int, int> sizes[] = {{1, 1},     {5, 3}, {6, 2}, {200, 300},
                                         {20000, 3}, {0, 9}, {9, 0}};
    for (const auto& size : sizes) {
        for (const int depth : {8, 24, 32}) {
            for (const int flags : {0x28, 0x08}) {
                SCOPED_TRACE(testing::Message() << size.first << "x" << size.second << "x" << depth
                                                << " flags " << flags);
                const std::string plain = tgaFile(size.first, size.second, depth, flags);
                const std::string expected =
                    shown(plain, size.first, size.second, depth, flags == 0x28);
                std::string file = plain;
                file[0] = '\xFF';
                file.insert(18, 255, 'i');

                std::istringstream quick(file + "rest");
                ASSERT_TRUE(TGAFileLoader::loadTarga(&image, quick));
                EXPECT_EQ(quick.get(), 'r') << "nothing is read after the last row";
                EXPECT_TRUE(pixels() == expected);
                EXPECT_EQ(image.getWidth(), size.first);
                EXPECT_EQ(image.getHeight(), size.second);
                EXPECT_EQ(image.getFormat(), depth == 32 ? pells::FMT_RGBA : pells::FMT_RGB);
                EXPECT_TRUE(image.isGrayscale()) << "once grey, for good";

                std::ifstream fromDisk(scratch.write("a.tga", file), std::ios_base::binary);
                ASSERT_TRUE(TGAFileLoader::loadTarga(&image, fromDisk));
                EXPECT_TRUE(pixels() == expected);

                SlowStream slow(file);
                ASSERT_TRUE(TGAFileLoader::loadTarga(&image, slow));
                EXPECT_TRUE(pixels() == expected);
            }
        }
    }
}

TEST_F(Tga, NamesItsDescriptor) {
    EXPECT_TRUE(load(tgaFile(1, 1, 24, 0x28)));
    EXPECT_TRUE(load(tgaFile(1, 1, 24, 0xCF)));
    EXPECT_EQ(pells_test::logLines(),
              (std::vector<std::string>{
                  "paint: loadTarga(): descriptor value 28, image is top first",
                  "paint: loadTarga(): descriptor value cf, image is bottom first"}));
}

struct BadTga {
    std::string file;
    std::string line;
    int width;  // and height: what the image says afterwards
    int components;
    bool grayscale;
};

TEST_F(Tga, IsRefusedWithItsReason) {
    std::string mapped = tgaFile(2, 2, 24);
    mapped[1] = 1;
    std::string cutId = tgaHeader(2, 2, 24);
    cutId[0] = 3;
    const BadTga files[] = {
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
    std::vector<std::string> expected;
    for (const BadTga& each : files) {
        EXPECT_FALSE(load(each.file)) << each.line;
        EXPECT_EQ(image.getData(), nullptr) << each.line;
        EXPECT_EQ(image.getWidth(), each.width) << each.line;
        EXPECT_EQ(image.getHeight(), each.width) << each.line;
        EXPECT_EQ(image.getNumComponents(), each.components) << each.line;
        EXPECT_EQ(image.isGrayscale(), each.grayscale) << each.line;
        expected.push_back("error: " + each.line);
    }
    std::istringstream in(tgaFile(1, 1, 24));
    EXPECT_FALSE(TGAFileLoader::loadTarga(nullptr, in));
    EXPECT_EQ(in.tellg(), 0);
    expected.emplace_back("error: can't load TGA into NULL Image");

    std::vector<std::string> errors;
    for (const std::string& line : pells_test::logLines()) {
        if (line.compare(0, 6, "paint:") != 0)
            errors.push_back(line);
    }
    EXPECT_EQ(errors, expected);
}

TEST_F(Tga, SurvivesEveryCutAndEveryFlippedBitOfItsHeader) {
    for (const int depth : {8, 24, 32}) {
        std::string file = tgaFile(3, 5, depth);
        file[0] = 2;
        file.insert(18, "id");
        for (std::size_t size = 0; size < file.size(); ++size) {
            EXPECT_FALSE(load(file.substr(0, size))) << size;
            EXPECT_FALSE(image.isValid()) << size;
        }
        for (std::size_t bit = 0; bit < 144; ++bit) {
            std::string flipped = file;
            flipped[bit / 8] = static_cast<char>(flipped[bit / 8] ^ (1 << bit % 8));
            const bool loaded = load(flipped);
            EXPECT_EQ(loaded, image.isValid()) << bit;
            EXPECT_LE(image.isValid() ? pixels().size() : 0, file.size() * 3) << bit;
        }
    }
}

TEST_F(Tga, TakesMemoryAsItsBytesArriveNotAsItsHeaderClaims) {
    for (const int depth : {8, 24, 32}) {
        EXPECT_FALSE(load(tgaHeader(65535, 65535, depth)));  // the log line has its memory now
        for (const std::size_t delivered : {0U, 100000U, 1000000U}) {
            const std::string file = tgaHeader(65535, 65535, depth) + std::string(delivered, 'x');
            SlowStream in(file);
            const std::size_t before = allocatedBytes;
            EXPECT_FALSE(TGAFileLoader::loadTarga(&image, in));
            EXPECT_LE(allocatedBytes - before, 5 * delivered + 20000) << depth;
        }
    }
}

TEST_F(Tga, WhoseStreamThrowsLeavesTheImageUsable) {
    for (const int depth : {8, 24, 32}) {
        const std::string file = tgaFile(300, 200, depth);
        for (const std::size_t delivered : {0U, 10U, 18U, 1000U, 59000U}) {
            SlowStream in(file.substr(0, delivered), true);
            EXPECT_THROW(TGAFileLoader::loadTarga(&image, in), std::runtime_error);
            EXPECT_FALSE(image.isValid());
            image.colorize(1, 2, 3, 4, 5, 6);
        }
        EXPECT_TRUE(load(file));
        EXPECT_TRUE(pixels() == shown(file, 300, 200, depth, true));
    }
}

}  // namespace
