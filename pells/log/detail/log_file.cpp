#include "pells/log/detail/log_file.h"

#include <utility>

namespace pells::detail {

namespace {

const long logBlockSize = 8192;

}  // namespace

LogFileBuffer::LogFileBuffer(std::string filePath)
    : simple_ostreambuf<char>(logBlockSize), path(std::move(filePath)) {}

LogFileBuffer::~LogFileBuffer() {
    syncBeforeEnd();
}

bool LogFileBuffer::open() {
    if (isOpen())
        return true;
    if (path.empty() || !file.openToWrite(path, mode))
        return false;
    mode = RegularFile::APPEND;
    return true;
}

int LogFileBuffer::close() {
    const bool written = sync() == 0;
    const bool closed = file.close();
    return written && closed ? 0 : -1;
}

bool LogFileBuffer::write(char* text, long count) {
    return open() && file.write(text, static_cast<std::size_t>(count));
}

LogFile::LogFile(const std::string& path)
    : simple_ostream<char, std::char_traits<char>, LogFileBuffer>(new LogFileBuffer(path)) {}

LogFile::~LogFile() = default;

void LogFile::open() {
    if (!ownBuffer().open())
        setstate(std::ios_base::failbit);
}

void LogFile::close() {
    if (ownBuffer().isOpen() && ownBuffer().close() != 0)
        setstate(std::ios_base::failbit);
}

}  // namespace pells::detail
