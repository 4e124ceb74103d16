#pragma once

#include <string>

#include "pells/log/stream_buffers.h"
#include "pells/platform/detail/regular_file.h"

namespace pells::detail {

/// The file of a log: emptied when it is opened first, appended to later. Implementation detail of
/// the log; not installed.
class LogFileBuffer : public simple_ostreambuf<char> {
public:
    /// \param filePath "" for no file.
    explicit LogFileBuffer(std::string filePath);
    ~LogFileBuffer() override;

    bool isOpen() const { return file.isOpen(); }

    /// Opens the file if it is closed; false when that cannot be done.
    bool open();

    /// Writes what is pending and closes the file; false when something did not reach it.
    int close() override;

protected:
    /// Opens the file for text that comes while it is closed: a message that logs while it is
    /// evaluated closes the file behind the line around it.
    bool write(char* text, long count) override;

private:
    const std::string path;
    RegularFile file;
    RegularFile::WriteMode mode = RegularFile::TRUNCATE;
};

/// A stream to the file. Once failed, it stays so and receives no more text.
class LogFile : public simple_ostream<char, std::char_traits<char>, LogFileBuffer> {
public:
    explicit LogFile(const std::string& path);
    ~LogFile() override;

    void open();
    void close();
};

}  // namespace pells::detail
