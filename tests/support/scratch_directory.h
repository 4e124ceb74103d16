#pragma once

#include <istream>
#include <string>
#include <vector>

namespace pells_test {

typedef std::vector<std::string> Lines;

/// A new empty folder below the system's folder for temporary files, removed with all it holds.
class ScratchDirectory {
public:
    ScratchDirectory();
    ~ScratchDirectory();
    ScratchDirectory(const ScratchDirectory&) = delete;
    ScratchDirectory& operator=(const ScratchDirectory&) = delete;

    /// The path of a file in the folder.
    std::string path(const std::string& name) const { return folder + "/" + name; }

    /// Writes a file, making the folders that its name goes through; returns its path.
    std::string write(const std::string& name, const std::string& bytes) const;

    /// Makes it the current directory until it is removed.
    void enter();

private:
    std::string folder;
    std::string previousDirectory;
};

/// What is left to be read.
std::string readAll(std::istream& in);

/// The bytes of a file; fails the test when it cannot be read.
std::string readFile(const std::string& path);

/// The names in the current directory in byte order, "pells.log" aside.
Lines files();

/// The lines of "pells.log" in the current directory without its three header lines, after closing
/// a log that is alive; only those that begin with `start`, which they leave out.
Lines logLines(const std::string& start = "");

Lines sorted(Lines lines);

/// Bytes that cannot be compressed, the same ones each time.
std::string noise(std::size_t size);

}  // namespace pells_test
