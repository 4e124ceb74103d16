#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <istream>
#include <limits>
#include <memory>
#include <new>
#include <streambuf>
#include <utility>

#include "pells/core/detail/get_area.h"
#include "pells/image/detail/channel_order.h"
#include "pells/image/image_base.h"
#include "pells/image/image_loaders.h"
#include "pells/log/log.h"

namespace pells {

namespace {

using Bytes = std::unique_ptr<unsigned char[]>;

std::uint64_t pixelLimit = std::uint64_t{1} << 28;

void reportTooLarge() {
    PELLS_LOG("error", "tga image too large");
}

/// Uninitialised memory, or null after a line in the log.
Bytes allocate(std::uint64_t size) {
    Bytes bytes;
    if (size <= static_cast<std::uint64_t>(std::numeric_limits<std::ptrdiff_t>::max()))
        bytes.reset(new (std::nothrow) unsigned char[static_cast<std::size_t>(size)]);
    if (!bytes)
        reportTooLarge();
    return bytes;
}

/// Reads exactly so many bytes, unless the stream ends.
bool readAll(std::istream& in, unsigned char* to, std::size_t size) {
    const std::streamsize wanted = static_cast<std::streamsize>(size);
    in.read(reinterpret_cast<char*>(to), wanted);
    return in.gcount() == wanted;
}

/// The next so many bytes, which count as read, or null when the buffer has fewer at hand. They
/// stay until the stream is used again.
const unsigned char* takeAtHand(std::streambuf& buffer, std::size_t size) {
    using detail::GetArea;
    const char* const next = GetArea::next(buffer);
    if (static_cast<std::size_t>(GetArea::limit(buffer) - next) < size)
        return nullptr;
    GetArea::moveTo(buffer, next + size);
    return reinterpret_cast<const unsigned char*>(next);
}

/// The next so many bytes, where the stream has them or else in the scratch memory; null when the
/// stream ends before.
const unsigned char* nextBytes(std::istream& in, unsigned char* scratch, std::size_t size) {
    if (const unsigned char* const atHand = in.good() ? takeAtHand(*in.rdbuf(), size) : nullptr)
        return atHand;
    return readAll(in, scratch, size) ? scratch : nullptr;
}

/// Whether the stream can tell that it has at least so many bytes left.
bool surelyHolds(std::istream& in, std::uint64_t size) {
    std::streambuf& buffer = *in.rdbuf();
    const std::streamoff wanted = static_cast<std::streamoff>(size);
    if (wanted == 0 || buffer.in_avail() >= wanted)
        return true;
    const std::streampos lost(std::streamoff(-1));
    const std::streampos here = buffer.pubseekoff(0, std::ios_base::cur, std::ios_base::in);
    if (here == lost)
        return false;
    const std::streampos end = buffer.pubseekoff(0, std::ios_base::end, std::ios_base::in);
    if (buffer.pubseekpos(here, std::ios_base::in) != here)
        in.setstate(std::ios_base::badbit);
    return end != lost && end - here >= wanted;
}

/// The rows of a picture, first shown row first, in memory that grows as rows arrive.
///
/// Rows that come bottom first are stored from the end of the memory towards its start, so that
/// growing never changes their order.
class PixelRows {
public:
    PixelRows(std::size_t bytesPerRow, std::size_t rowCount, bool rowsAreTopFirst)
        : rowBytes(bytesPerRow), rows(rowCount), topFirst(rowsAreTopFirst) {}

    /// Makes room for so many rows, the most there are if need be.
    bool reserve(std::size_t needed) {
        return needed <= capacity || grow(std::min(rows, std::max(needed, 2 * capacity)));
    }

    /// Makes room for exactly so many rows and keeps those that are stored.
    bool grow(std::size_t newCapacity) {
        Bytes larger = allocate(std::uint64_t(newCapacity) * rowBytes);
        if (!larger)
            return false;
        const std::size_t kept = capacity * rowBytes;
        const std::size_t shift = topFirst ? 0 : (newCapacity - capacity) * rowBytes;
        if (kept != 0)
            std::memcpy(larger.get() + shift, bytes.get(), kept);
        bytes = std::move(larger);
        capacity = newCapacity;
        return true;
    }

    /// Stores a piece of the file's pixels that begins so many bytes after the first pixel, in
    /// red-green-blue order.
    void store(const unsigned char* piece, std::size_t size, std::uint64_t at, int components) {
        std::size_t row = static_cast<std::size_t>(at / rowBytes);
        std::size_t column = static_cast<std::size_t>(at % rowBytes);
        while (size != 0) {
            const std::size_t run = std::min(size, rowBytes - column);
            const std::size_t place = topFirst ? row : capacity - 1 - row;
            detail::bgrToRgb(piece, &bytes[place * rowBytes + column], run, components);
            piece += run;
            size -= run;
            column = 0;
            ++row;
        }
    }

    Bytes release() { return std::move(bytes); }

private:
    std::size_t rowBytes;
    std::size_t rows;
    bool topFirst;
    std::size_t capacity = 0;
    Bytes bytes;
};

}  // namespace

struct TGAFileLoader::Header {
    static const std::size_t size = 18;

    explicit Header(const unsigned char* bytes)
        : idLength(Image_base::getCharValue(bytes)),
          colorMapType(Image_base::getCharValue(bytes + 1)),
          width(Image_base::getInt(bytes + 12)),
          height(Image_base::getInt(bytes + 14)),
          depth(Image_base::getCharValue(bytes + 16)),
          descriptor(Image_base::getCharValue(bytes + 17)),
          topFirst((descriptor & 0x20) != 0) {}

    int idLength;
    int colorMapType;
    int width;
    int height;
    int depth;
    int descriptor;
    bool topFirst;
};

std::uint64_t TGAFileLoader::maximumPixels() {
    return pixelLimit;
}

void TGAFileLoader::setMaximumPixels(std::uint64_t pixels) {
    pixelLimit = pixels;
}

bool TGAFileLoader::loadTarga(Image_base* image, std::istream& in) {
    if (!image) {
        PELLS_LOG("error", "can't load TGA into NULL Image");
        return false;
    }
    image->clearImage();

    unsigned char buffer[256];
    if (!readAll(in, buffer, Header::size)) {
        PELLS_LOG("error", "tga file shorter than header (" << in.gcount() << " bytes)");
        return false;
    }
    const Header header(buffer);
    PELLS_LOG("paint", "loadTarga(): descriptor value "
                           << std::hex << header.descriptor << std::dec << ", image is "
                           << (header.topFirst ? "top first" : "bottom first"));
    if (header.colorMapType != 0) {
        PELLS_LOG("error", "bad colormap value " << header.colorMapType);
        return false;
    }
    if (header.idLength != 0 && !readAll(in, buffer, static_cast<std::size_t>(header.idLength))) {
        PELLS_LOG("error", "tga file ends inside id info");
        return false;
    }
    switch (header.depth) {
        case 8:
            return loadGray(*image, in, header);
        case 24:
        case 32:
            return loadColor(*image, in, header);
        default:
            PELLS_LOG("error", "unsupported pixel depth " << header.depth);
            return false;
    }
}

bool TGAFileLoader::loadGray(Image_base& image, std::istream& in, const Header& header) {
    image.grayscale = true;
    image.numComponents = 3;
    image.format = FMT_RGB;
    image.width = header.width;
    image.height = header.height;
    image.grayData = nullptr;
    image.graySize = 0;

    Bytes levels = _loadData(in, header.width, header.height, 1, header.topFirst);
    if (!levels)
        return false;
    const std::uint64_t count =
        static_cast<std::uint64_t>(header.width) * static_cast<std::uint64_t>(header.height);
    image.data = allocate(3 * count);
    if (!image.data)
        return false;
    image.grayData = std::move(levels);
    image.graySize = static_cast<std::size_t>(count);
    image.colorize(0, 0, 0, 255, 255, 255);
    return true;
}

bool TGAFileLoader::loadColor(Image_base& image, std::istream& in, const Header& header) {
    image.numComponents = header.depth / 8;
    image.format = header.depth == 24 ? FMT_RGB : FMT_RGBA;
    image.width = header.width;
    image.height = header.height;
    image.data = _loadData(in, header.width, header.height, image.numComponents, header.topFirst);
    return image.isValid();
}

std::unique_ptr<unsigned char[]> TGAFileLoader::_loadData(std::istream& in, int width, int height,
                                                          int components, bool topFirst) {
    const std::size_t rowBytes =
        static_cast<std::size_t>(width) * static_cast<std::size_t>(components);
    const std::size_t rows = static_cast<std::size_t>(height);
    const std::uint64_t size = std::uint64_t(rowBytes) * rows;
    if (size / static_cast<std::uint64_t>(components) > pixelLimit) {
        reportTooLarge();
        return nullptr;
    }
    PixelRows pixels(rowBytes, rows, topFirst);
    // Memory for the whole picture is taken at once only if its bytes are there.
    if (surelyHolds(in, size) && !pixels.grow(rows))
        return nullptr;

    unsigned char scratch[16384 * 3];  // whole pixels of either size
    for (std::uint64_t at = 0; at < size;) {
        const std::size_t count =
            static_cast<std::size_t>(std::min<std::uint64_t>(sizeof scratch, size - at));
        const unsigned char* const piece = nextBytes(in, scratch, count);
        if (!piece) {
            PELLS_LOG("error", "tga file shorter than data");
            return nullptr;
        }
        if (!pixels.reserve(static_cast<std::size_t>((at + count + rowBytes - 1) / rowBytes)))
            return nullptr;
        pixels.store(piece, count, at, components);
        at += count;
    }
    return pixels.release();
}

}  // namespace pells
