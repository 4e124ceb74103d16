#include "support/scratch_directory.h"

#include <gtest/gtest.h>

#include <algorithm>
#include <boost/filesystem/fstream.hpp>
#include <boost/filesystem/operations.hpp>
#include <iterator>
#include <random>

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

std::string readAll(std::istream& in) {
    return std::string(std::istreambuf_iterator<char>(in), std::istreambuf_iterator<char>());
}

std::string readFile(const std::string& path) {
    fs::ifstream in(path, std::ios::binary);
    EXPECT_TRUE(in.is_open()) << path;
    return readAll(in);
}

Lines files() {
    Lines names;
    for (const fs::directory_entry& entry : fs::directory_iterator(".")) {
        if (entry.path().filename() != "pells.log")
            names.push_back(entry.path().filename().string());
    }
    return sorted(names);
}

Lines logLines(const std::string& start) {
    if (pells::Log::singleton)
        pells::Log::singleton->close();
    fs::ifstream in("pells.log");
    EXPECT_TRUE(in.is_open());
    Lines lines;
    int number = 0;
    for (std::string line; std::getline(in, line);) {
        if (++number > 3 && line.compare(0, start.size(), start) == 0)
            lines.push_back(line.substr(start.size()));
    }
    return lines;
}

Lines sorted(Lines lines) {
    std::sort(lines.begin(), lines.end());
    return lines;
}

std::string noise(std::size_t size) {
    std::mt19937 random(7);
    std::string bytes(size, '\0');
    std::generate(bytes.begin(), bytes.end(), [&] { return static_cast<char>(random()); });
    return bytes;
}

}  // namespace pells_test
