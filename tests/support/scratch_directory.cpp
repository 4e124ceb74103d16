#include "support/scratch_directory.h"

#include <gtest/gtest.h>

#include <boost/filesystem/fstream.hpp>
#include <boost/filesystem/operations.hpp>
#include <iterator>
#include <sstream>

#include "pells/log/log.h"

namespace pells_test {

namespace fs = boost::filesystem;

ScratchDirectory::ScratchDirectory()
    : folder((fs::temp_directory_path() / fs::unique_path("pells-test-%%%%-%%%%-%%%%")).string()) {
    fs::create_directory(folder);
}

ScratchDirectory::~ScratchDirectory() {
    boost::system::error_code ignored;
    if (!previousDirectory.empty())
        fs::current_path(previousDirectory, ignored);
    fs::remove_all(folder, ignored);
}

std::string ScratchDirectory::write(const std::string& name, const std::string& bytes) const {
    const fs::path file = path(name);
    fs::create_directories(file.parent_path());
    fs::ofstream out(file, std::ios::binary);
    out.write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
    EXPECT_TRUE(out.flush()) << file;
    return file.string();
}

void ScratchDirectory::enter() {
    previousDirectory = fs::current_path().string();
    fs::current_path(folder);
}

std::string readFile(const std::string& path) {
    fs::ifstream in(path, std::ios::binary);
    EXPECT_TRUE(in.is_open()) << path;
    return std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

std::vector<std::string> logLines() {
    if (pells::Log::singleton)
        pells::Log::singleton->close();
    std::istringstream text(readFile("pells.log"));
    std::vector<std::string> lines;
    const std::size_t headerLines = 3;
    std::size_t number = 0;
    for (std::string line; std::getline(text, line);) {
        if (number++ >= headerLines)
            lines.push_back(line);
    }
    return lines;
}

}  // namespace pells_test
