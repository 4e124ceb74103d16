#include "pells/image/image_base.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <exception>
#include <limits>
#include <new>

#include "pells/asset/zlib_wrapper.h"
#include "pells/image/image_loaders.h"
#include "pells/log/log.h"
#include "pells/material/color.h"

namespace pells {

namespace {

std::size_t rgbaBytes(int pixelsWide, int pixelsHigh) {
    if (pixelsWide < 0 || pixelsHigh < 0)
        throw std::bad_array_new_length();
    const std::uint64_t pixels =
        static_cast<std::uint64_t>(pixelsWide) * static_cast<std::uint64_t>(pixelsHigh);
    if (pixels > std::numeric_limits<std::ptrdiff_t>::max() / 4)
        throw std::bad_array_new_length();
    return static_cast<std::size_t>(pixels * 4);
}

struct Hsv {
    float hue = 0;
    float saturation = 0;
    float value = 0;
};

Hsv hsvOfBytes(unsigned char r, unsigned char g, unsigned char b) {
    const auto unit = [](unsigned char channel) {
        return static_cast<float>(channel * (1.0 / 255.0));
    };
    Hsv hsv;
    RGBtoHSV(unit(r), unit(g), unit(b), hsv.hue, hsv.saturation, hsv.value);
    return hsv;
}

using Pixel = std::array<unsigned char, 4>;

Pixel blendedPixel(const Hsv& black, const Hsv& white, unsigned gray) {
    const float weight = static_cast<float>(gray) * (1.0F / 255.0F);
    const Color hsv = HSVInterpolate(black.hue, black.saturation, black.value, white.hue,
                                     white.saturation, white.value, weight);
    float r = 0;
    float g = 0;
    float b = 0;
    HSVtoRGB(hsv.r, hsv.g, hsv.b, r, g, b);
    const auto byte = [](float unit) {
        return static_cast<unsigned char>(static_cast<double>(unit) * 255.0);
    };
    return {byte(r), byte(g), byte(b), 255};
}

void paintRgb(const std::array<Pixel, 256>& palette, const unsigned char* gray, std::size_t count,
              unsigned char* pixel) {
    if (count == 0)
        return;
    // Four bytes are stored at once; the fourth is the next pixel's, which is not painted yet.
    for (std::size_t i = 0; i + 1 < count; ++i, pixel += 3)
        std::memcpy(pixel, palette[gray[i]].data(), 4);
    std::memcpy(pixel, palette[gray[count - 1]].data(), 3);
}

void paintRgba(const std::array<Pixel, 256>& palette, const unsigned char* gray, std::size_t count,
               unsigned char* pixel) {
    for (std::size_t i = 0; i < count; ++i, pixel += 4)
        std::memcpy(pixel, palette[gray[i]].data(), 4);
}

}  // namespace

Image_base::Image_base(int pixelsWide, int pixelsHigh)
    : width(pixelsWide),
      height(pixelsHigh),
      numComponents(4),
      format(FMT_RGBA),
      data(new unsigned char[rgbaBytes(pixelsWide, pixelsHigh)]) {}

Image_base::Image_base(const std::string& name) : fileName(name) {
    const std::string::size_type dot = name.rfind('.');
    if (dot != std::string::npos)
        extension = name.substr(dot);
    if (extension == ".pell") {
        loadPellFileImage(name);
        loadedFromPell = true;
    }
}

Image_base::~Image_base() = default;

void Image_base::init() {
    width = 0;
    height = 0;
    numComponents = 0;
    grayscale = false;
    data = nullptr;
    grayData = nullptr;
    graySize = 0;
    loadedFromPell = false;
    bogus = false;
}

void Image_base::clearImage() {
    data = nullptr;
    width = 0;
    height = 0;
    numComponents = 0;
    fileName.clear();
}

void Image_base::makeBogusImage() {
    static const unsigned char row[] = {255, 0, 0, 255, 0, 255, 0, 255};
    data.reset(new unsigned char[2 * sizeof row]);
    std::memcpy(data.get(), row, sizeof row);
    std::memcpy(data.get() + sizeof row, row, sizeof row);
    format = FMT_RGBA;
    width = 2;
    height = 2;
    numComponents = 4;
    bogus = true;
}

void Image_base::loadTarga(const std::string& name) {
    TGAFileLoader loader(name.c_str());
    bool loaded = false;
    try {
        loaded = loader.uploadImage(this);
    } catch (const ZlibWrapper::ZlibError&) {
        // It left its line in the log when it was made.
    } catch (const std::exception& failure) {
        PELLS_LOG("error",
                  "Image(" << loader.getFileName() << "): Can't read image: " << failure.what());
    }
    if (!loaded)
        makeBogusImage();
}

void Image_base::loadPellFileImage(const std::string& name) {
    if (!PellTGAFileLoader(name.c_str()).uploadImage(this))
        makeBogusImage();
}

bool Image_base::dimensionsArePowerOfTwo() const {
    return (width & (width - 1)) == 0 && (height & (height - 1)) == 0;
}

void Image_base::getColorComponents(int x, int y, unsigned char* r, unsigned char* g,
                                    unsigned char* b, unsigned char* a) const {
    const unsigned char* const pixel = &data[offsetOf(x, y)];
    *r = pixel[0];
    *g = pixel[1];
    *b = pixel[2];
    if (a)
        *a = pixel[3];
}

bool Image_base::setColorAsARGB(int x, int y, unsigned char c0, unsigned char c1, unsigned char c2,
                                unsigned char c3) {
    // A read that failed on the way leaves a size without data.
    if (x < 0 || y < 0 || x >= width || y >= height || !data)
        return false;
    unsigned char* const pixel = &data[offsetOf(x, y)];
    pixel[0] = c0;
    pixel[1] = c1;
    pixel[2] = c2;
    if (numComponents > 3)
        pixel[3] = c3;
    return true;
}

void Image_base::flipVertically() {
    if (!data)
        return;
    for (int upper = 0, lower = height - 1; upper < lower; ++upper, --lower) {
        unsigned char* const row = data.get() + offsetOf(0, upper);
        std::swap_ranges(row, row + offsetOf(0, 1), data.get() + offsetOf(0, lower));
    }
}

void Image_base::colorize(unsigned char r1, unsigned char g1, unsigned char b1, unsigned char r2,
                          unsigned char g2, unsigned char b2) {
    if (!grayscale || !data)
        return;
    const Hsv black = hsvOfBytes(r1, g1, b1);
    const Hsv white = hsvOfBytes(r2, g2, b2);
    std::array<Pixel, 256> palette{};
    for (unsigned gray = 0; gray < palette.size(); ++gray)
        palette[gray] = blendedPixel(black, white, gray);

    const std::size_t pixels = static_cast<std::size_t>(width) * static_cast<std::size_t>(height);
    const std::size_t painted = std::min(pixels, graySize);
    if (numComponents == 4)
        paintRgba(palette, grayData.get(), painted, data.get());
    else if (numComponents == 3)
        paintRgb(palette, grayData.get(), painted, data.get());
}

void Image_base::setCharValue(unsigned char* p, int v) {
    p[0] = static_cast<unsigned char>(v & 0xFF);
}

void Image_base::setInt(unsigned char* p, int v) {
    setCharValue(p, v);
    setCharValue(p + 1, v >> 8);
}

int Image_base::getLong(const unsigned char* p) {
    const std::uint32_t low = static_cast<std::uint32_t>(getInt(p));
    const std::uint32_t high = static_cast<std::uint32_t>(getInt(p + 2));
    return static_cast<int>(low | high << 16);
}

void Image_base::setLong(unsigned char* p, int v) {
    setInt(p, v);
    setInt(p + 2, v >> 16);
}

}  // namespace pells
