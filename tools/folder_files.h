#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <string>
#include <utility>
#include <vector>

namespace pells {

/// A regular file that is read from its start, once.
///
/// Opening waits for nothing: pipes, devices and folders are refused by what is open, not by what
/// the name stood for a moment ago.
class SourceFile {
public:
    /// \throws FileError, here and below, with the path.
    explicit SourceFile(const std::string& path);

    /// Takes over a descriptor. \param path for messages.
    SourceFile(int openDescriptor, const std::string& path);
    ~SourceFile();
    SourceFile(const SourceFile&) = delete;
    SourceFile& operator=(const SourceFile&) = delete;

    /// Stores up to so many bytes and returns how many; 0 at the end.
    ///
    /// \throws FileError also when the file is not as long as it was when it was opened: what was
    ///         read may be a part of one state and a part of another, and might have no end.
    std::size_t read(char* into, std::size_t room);

private:
    void checkKind();

    std::string name;
    int descriptor;
    std::uint64_t left = 0;
};

/// The files below a folder, as they were when it was listed, and how to open each of them without
/// ever leaving the folder.
class FolderFiles {
public:
    /// Lists the folder. Symbolic links to regular files below it count as copies of those;
    /// temporary files of an AtomicFile do not count.
    ///
    /// \throws FileError with the path of what cannot be listed.
    explicit FolderFiles(const std::string& folder);
    ~FolderFiles();
    FolderFiles(const FolderFiles&) = delete;
    FolderFiles& operator=(const FolderFiles&) = delete;

    /// What is known of a file below the folder.
    struct File {
        std::string obstacle;  ///< why it cannot be stored; empty when it can
        std::string target;    ///< its name below the folder, links resolved
    };

    /// By their names below the folder, in byte-wise order.
    const std::map<std::string, File>& getFiles() const { return files; }

    /// Whether a path that exists lies in the folder or below it.
    bool contains(const std::string& path) const;

    /// Opens a file of the list. No component of the name may be a link by now.
    SourceFile open(const std::string& name, const File& file);

private:
    void list(const std::string& prefix, std::vector<std::string>& folders);
    int folderOf(const std::string& name, const std::string& path);
    void closeFolders(std::size_t kept);

    std::string root;
    std::string realRoot;
    std::map<std::string, File> files;
    /// The folders that the file opened last lies in, each with its descriptor, the root first.
    std::vector<std::pair<std::string, int>> chain;
};

}  // namespace pells
