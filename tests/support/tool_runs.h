#pragma once

#include <gtest/gtest.h>
#include <png.h>
#include <sys/wait.h>

#include <algorithm>
#include <boost/filesystem/operations.hpp>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <vector>

#include "support/scratch_directory.h"

/// \file
/// For tests that run the tool; they define PELLS_TOOL and PELLS_SUPPRESSIONS, and link libpng.

namespace pells_test {

/// What a run of the real tool left behind.
struct Outcome {
    int status;
    std::string out;
    std::string err;
};

/// Each test has a folder to run the tool in, and one beside it for what the tool prints.
class ToolRuns : public ::testing::Test {
protected:
    ToolRuns() { scratch.enter(); }

    /// Runs a script in which $PELLS is the tool.
    Outcome shell(const std::string& script) {
        printed.write("script",
                      "export LSAN_OPTIONS=print_suppressions=0:suppressions='" PELLS_SUPPRESSIONS
                      "'\nPELLS='" PELLS_TOOL "'\n" +
                          script + "\n");
        const std::string command = "bash '" + printed.path("script") + "' >'" +
                                    printed.path("out") + "' 2>'" + printed.path("err") + "'";
        const int status = std::system(command.c_str());
        return {WEXITSTATUS(status), readFile(printed.path("out")), readFile(printed.path("err"))};
    }

    Outcome pells(const std::string& arguments) { return shell("\"$PELLS\" " + arguments); }

    /// The names in the current folder, the log's aside.
    static std::vector<std::string> files() {
        std::vector<std::string> names;
        for (const boost::filesystem::directory_entry& entry :
             boost::filesystem::directory_iterator(".")) {
            if (entry.path().filename() != "pells.log")
                names.push_back(entry.path().filename().string());
        }
        std::sort(names.begin(), names.end());
        return names;
    }

    ScratchDirectory printed;
    ScratchDirectory scratch;
};

/// A decoded PNG: 0xRRGGBB each.
inline std::vector<std::uint32_t> decodePng(const std::string& path, unsigned& width) {
    png_image image;
    std::memset(&image, 0, sizeof image);
    image.version = PNG_IMAGE_VERSION;
    EXPECT_TRUE(png_image_begin_read_from_file(&image, path.c_str())) << image.message;
    image.format = PNG_FORMAT_RGB;
    std::vector<unsigned char> bytes(PNG_IMAGE_SIZE(image));
    EXPECT_TRUE(png_image_finish_read(&image, nullptr, bytes.data(), 0, nullptr)) << image.message;
    width = image.width;
    std::vector<std::uint32_t> pixels;
    for (std::size_t i = 0; i + 2 < bytes.size(); i += 3)
        pixels.push_back(std::uint32_t{bytes[i]} << 16 | std::uint32_t{bytes[i + 1]} << 8 |
                         bytes[i + 2]);
    return pixels;
}

/// A TGA picture: a header and what follows it.
inline std::string tga(int type, unsigned width, unsigned height, int depth,
                       const std::string& pixels) {
    std::string header(18, '\0');
    header[2] = static_cast<char>(type);
    header[12] = static_cast<char>(width);
    header[13] = static_cast<char>(width >> 8);
    header[14] = static_cast<char>(height);
    header[15] = static_cast<char>(height >> 8);
    header[16] = static_cast<char>(depth);
    return header + pixels;
}

}  // namespace pells_test
