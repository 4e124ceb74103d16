// Pictures: reading TGA files, recolouring grey ones and handing out rows of packed pixels.

#include <FreeImage.h>
#include <SDL_image.h>
#include <stb_image.h>

#include <algorithm>
#include <cstring>
#include <memory>
#include <random>
#include <sstream>
#include <vector>

#include "bench/support/bench.h"
#include "pells/image/image_base.h"
#include "pells/image/image_loaders.h"
#include "pells/material/color.h"

namespace {

using pells::Image_base;

const std::size_t headerSize = 18;
const int topFirst = 0x20;

/// A TGA file of that many bits per pixel whose rows are equal, but for a first byte.
std::string tgaFile(int side, int bits, int flags) {
    std::string file(headerSize, '\0');
    auto* const header = reinterpret_cast<unsigned char*>(&file[0]);
    header[2] = bits == 8 ? 3 : 2;
    Image_base::setInt(header + 12, side);
    Image_base::setInt(header + 14, side);
    Image_base::setCharValue(header + 16, bits);
    Image_base::setCharValue(header + 17, flags | (bits == 32 ? 8 : 0));
    std::string row(static_cast<std::size_t>(side * bits / 8), '\0');
    std::minstd_rand random(8);
    std::generate(row.begin(), row.end(), [&random] { return static_cast<char>(random()); });
    file.reserve(headerSize + row.size() * static_cast<std::size_t>(side));
    for (int y = 0; y < side; ++y) {
        row.front() = static_cast<char>(y);
        file += row;
    }
    return file;
}

bool load(Image_base& image, const std::string& file) {
    std::istringstream in(file);
    return pells::TGAFileLoader::loadTarga(&image, in);
}

/// One kind of TGA file, made when the first contestant reads it.
class TgaFile {
public:
    TgaFile(std::int64_t pictureSide, int bitsPerPixel, int headerFlags)
        : side(static_cast<int>(pictureSide)), bits(bitsPerPixel), flags(headerFlags) {}

    const std::string& bytes() {
        if (file.empty())
            file = tgaFile(side, bits, flags);
        return file;
    }

    const unsigned char* data() { return reinterpret_cast<const unsigned char*>(bytes().data()); }
    int size() { return static_cast<int>(bytes().size()); }

    /// The last contestant lets go of it: the largest have 256 MB.
    void release() { std::string().swap(file); }

    /// Bytes a pixel in memory; grey levels become colours.
    int components() const { return bits == 8 ? 3 : bits / 8; }

private:
    int side;
    int bits;
    int flags;
    std::string file;
};

void readWithPells(benchmark::State& state, TgaFile& file) {
    std::istringstream in(file.bytes());
    Image_base image(0, 0);
    for (auto _ : state) {
        in.clear();
        in.seekg(0);
        if (!pells::TGAFileLoader::loadTarga(&image, in))
            state.SkipWithError("the picture cannot be read");
    }
}

void readWithStb(benchmark::State& state, TgaFile& file) {
    Image_base expected(0, 0);
    load(expected, file.bytes());
    const std::size_t bytes = static_cast<std::size_t>(expected.getWidth()) *
                              static_cast<std::size_t>(expected.getHeight()) *
                              static_cast<std::size_t>(file.components());
    for (auto _ : state) {
        int width = 0, height = 0, components = 0;
        stbi_uc* const pixels = stbi_load_from_memory(file.data(), file.size(), &width, &height,
                                                      &components, file.components());
        if (!pixels)
            state.SkipWithError("the picture cannot be read");
        if (state.iterations() == 0 && std::memcmp(pixels, expected.getData(), bytes) != 0)
            state.SkipWithError("the pixels differ");
        stbi_image_free(pixels);
    }
}

void readWithSdl(benchmark::State& state, TgaFile& file) {
    for (auto _ : state) {
        SDL_Surface* const surface = IMG_LoadTGA_RW(SDL_RWFromConstMem(file.data(), file.size()));
        if (!surface)
            state.SkipWithError("the picture cannot be read");
        SDL_FreeSurface(surface);
    }
}

void readWithFreeImage(benchmark::State& state, TgaFile& file) {
    auto* const bytes = const_cast<BYTE*>(file.data());
    for (auto _ : state) {
        FIMEMORY* const memory = FreeImage_OpenMemory(bytes, static_cast<DWORD>(file.size()));
        FIBITMAP* const bitmap = FreeImage_LoadFromMemory(FIF_TARGA, memory, 0);
        if (!bitmap)
            state.SkipWithError("the picture cannot be read");
        FreeImage_Unload(bitmap);
        FreeImage_CloseMemory(memory);
    }
}

/// What no reader can beat: the pixels in memory of their own.
void copyPixels(benchmark::State& state, TgaFile& file) {
    const std::size_t size = file.bytes().size() - headerSize;
    for (auto _ : state) {
        const std::unique_ptr<unsigned char[]> pixels(new unsigned char[size]);
        std::memcpy(pixels.get(), file.data() + headerSize, size);
        benchmark::DoNotOptimize(pixels.get());
        benchmark::ClobberMemory();
    }
}

void addTga(std::int64_t side, int bits, int flags) {
    const std::string work = "tga/" + std::to_string(bits) + " bits " +
                             (flags == topFirst ? "top first" : "bottom first");
    const auto file = std::make_shared<TgaFile>(side, bits, flags);
    const auto add = [&](const char* contestant, void (*read)(benchmark::State&, TgaFile&)) {
        bench::add(work, side, contestant, [=](benchmark::State& state) { read(state, *file); });
    };
    add("pells", &readWithPells);
    if (side < 8192) {
        add("stb_image", &readWithStb);
        add("SDL_image", &readWithSdl);
        add("FreeImage", &readWithFreeImage);
    }
    if (bits != 8)
        bench::add(work, side, "memcpy", [=](benchmark::State& state) {
            copyPixels(state, *file);
            file->release();
        });
}

/// Recolours as the definition says, pixel by pixel; `pixels` holds the result.
void colorizePlainly(const std::string& levels, int components, std::string& pixels) {
    const auto unit = [](int channel) { return static_cast<float>(channel * (1.0 / 255.0)); };
    float black[3];
    float white[3];
    pells::RGBtoHSV(unit(26), unit(51), unit(102), black[0], black[1], black[2]);
    pells::RGBtoHSV(unit(255), unit(204), unit(153), white[0], white[1], white[2]);
    unsigned char* pixel = reinterpret_cast<unsigned char*>(&pixels[0]);
    for (const char level : levels) {
        const float weight =
            static_cast<float>(static_cast<unsigned char>(level)) * (1.0F / 255.0F);
        const pells::Color hsv = pells::HSVInterpolate(black[0], black[1], black[2], white[0],
                                                       white[1], white[2], weight);
        float rgb[3];
        pells::HSVtoRGB(hsv.r, hsv.g, hsv.b, rgb[0], rgb[1], rgb[2]);
        for (int i = 0; i < 3; ++i)
            pixel[i] = static_cast<unsigned char>(static_cast<double>(rgb[i]) * 255.0);
        if (components == 4)
            pixel[3] = 255;
        pixel += components;
    }
}

void addColorize(std::int64_t side, int components) {
    const std::string work = "colorize/" + std::to_string(components) + " bytes";
    const int sidePixels = static_cast<int>(side);
    const std::size_t pixels = static_cast<std::size_t>(side * side);
    bench::add(work, side, "pells", [=](benchmark::State& state) {
        const std::string gray = tgaFile(sidePixels, 8, topFirst);
        Image_base image(0, 0);
        load(image, gray);
        // A picture read later is painted by the grey levels that are there.
        if (components == 4)
            load(image, tgaFile(sidePixels, 32, topFirst));
        image.colorize(26, 51, 102, 255, 204, 153);
        std::string expected(pixels * static_cast<std::size_t>(components), '\0');
        colorizePlainly(gray.substr(headerSize), components, expected);
        if (image.getNumComponents() != components ||
            std::memcmp(image.getData(), expected.data(), expected.size()) != 0)
            state.SkipWithError("the pixels differ");
        for (auto _ : state)
            image.colorize(26, 51, 102, 255, 204, 153);
    });
    bench::add(work, side, "pixel by pixel", [=](benchmark::State& state) {
        const std::string levels = tgaFile(sidePixels, 8, topFirst).substr(headerSize);
        std::string result(pixels * static_cast<std::size_t>(components), '\0');
        for (auto _ : state) {
            colorizePlainly(levels, components, result);
            benchmark::ClobberMemory();
        }
    });
}

/// All rows of a picture in one packed form, by row and pixel by pixel.
template <class Packed>
void addRows(const std::string& form, std::int64_t side, int bits,
             void (Image_base::*rowGetter)(int, Packed*) const,
             Packed (Image_base::*pixelGetter)(int, int) const) {
    const std::string work = "rows/" + form + " of " + std::to_string(bits) + " bits";
    const auto addReader = [&](const char* contestant, auto readRow) {
        bench::add(work, side, contestant, [=](benchmark::State& state) {
            Image_base image(0, 0);
            load(image, tgaFile(static_cast<int>(side), bits, topFirst));
            std::vector<Packed> row(static_cast<std::size_t>(side));
            for (auto _ : state) {
                for (int y = 0; y < image.getHeight(); ++y) {
                    readRow(image, y, row.data());
                    benchmark::ClobberMemory();
                }
            }
        });
    };
    addReader("pells",
              [=](const Image_base& image, int y, Packed* row) { (image.*rowGetter)(y, row); });
    addReader("pixel getter", [=](const Image_base& image, int y, Packed* row) {
        for (int x = 0; x < image.getWidth(); ++x)
            row[x] = (image.*pixelGetter)(x, y);
    });
}

void addAllRows(std::int64_t side, int bits) {
    addRows<std::uint32_t>("ABGR", side, bits, &Image_base::getRowAsABGR,
                           &Image_base::getColorAsABGR);
    addRows<std::uint32_t>("ARGB", side, bits, &Image_base::getRowAsARGB,
                           &Image_base::getColorAsARGB);
    addRows<std::uint16_t>("A1R5G5B5", side, bits, &Image_base::getRowAsA1R5G5B5,
                           &Image_base::getColorAsA1R5G5B5);
    addRows<std::uint16_t>("A4R4G4B4", side, bits, &Image_base::getRowAsA4R4G4B4,
                           &Image_base::getColorAsA4R4G4B4);
    addRows<std::uint16_t>("A8R3G3B2", side, bits, &Image_base::getRowAsA8R3G3B2,
                           &Image_base::getColorAsA8R3G3B2);
    addRows<std::uint32_t>("A2B10G10R10", side, bits, &Image_base::getRowAsA2B10G10R10,
                           &Image_base::getColorAsA2B10G10R10);
}

}  // namespace

void addBenchmarks() {
    for (const std::int64_t side : bench::sizes({64, 1024, 8192})) {
        for (const int bits : {8, 24, 32}) {
            if (side == 8192 && bits == 8)
                continue;
            addTga(side, bits, 0);
            addTga(side, bits, topFirst);
        }
    }
    for (const int components : {3, 4})
        addColorize(1024, components);
    for (const int bits : {24, 32})
        addAllRows(256, bits);
}
