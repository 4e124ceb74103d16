#pragma once

#include <string>
#include <vector>

namespace pells_test {

/// A new empty folder below the system's folder for temporary files, removed with all it holds.
class ScratchDirectory {
public:
    ScratchDirectory();
    ~ScratchDirectory();
    ScratchDirectory(const ScratchDirectory&) = delete;
    ScratchDirectory& operator=(const ScratchDirectory&) = delete;

    const std::string& path() const { return folder; }

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

/// The bytes of a file; fails the test when it cannot be read.
std::string readFile(const std::string& path);

/// The lines of "pells.log" in the current directory without its three header lines, after closing
/// a log that is alive.
std::vector<std::string> logLines();

}  // namespace pells_test
