#pragma once

#include <gtest/gtest.h>
#include <png.h>
#include <sys/wait.h>

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <string>
#include <utility>
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

/// Arguments of the tool, and what it says behind the beginning of its line.
typedef std::pair<const char*, const char*> Failing;

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

    /// Expects one line that says what, where and why; a status that tells wrong usage from other
    /// failures; nothing on standard output; no file made, and one that exists as it was.
    void expectFailure(const std::string& command, const std::string& line,
                       const std::string& existing) {
        SCOPED_TRACE(command);
        const Lines before = files();
        const std::string bytes = readFile(existing);
        const Outcome outcome = pells(command);
        EXPECT_EQ(outcome.status, line.find("(see --help)") != std::string::npos ? 2 : 1);
        EXPECT_EQ(outcome.err, line + "\n");
        EXPECT_EQ(outcome.out, "");
        EXPECT_EQ(files(), before);
        EXPECT_EQ(readFile(existing), bytes);
    }

    ScratchDirectory printed;
    ScratchDirectory scratch;
};

/// The pixels of a PNG picture, 0xRRGGBB each.
inline std::vector<std::uint32_t> decodePng(const std::string& path) {
    png_image image;
    std::memset(&image, 0, sizeof image);
    image.version = PNG_IMAGE_VERSION;
    EXPECT_TRUE(png_image_begin_read_from_file(&image, path.c_str())) << image.message;
    image.format = PNG_FORMAT_RGB;
    std::vector<unsigned char> bytes(PNG_IMAGE_SIZE(image));
    EXPECT_TRUE(png_image_finish_read(&image, nullptr, bytes.data(), 0, nullptr)) << image.message;
    std::vector<std::uint32_t> pixels;
    for (std::size_t i = 0; i + 2 < bytes.size(); i += 3)
        pixels.push_back(std::uint32_t{bytes[i]} << 16 | std::uint32_t{bytes[i + 1]} << 8 |
                         bytes[i + 2]);
    return pixels;
}

}  // namespace pells_test
