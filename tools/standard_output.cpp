#include "tools/standard_output.h"

#include <cerrno>
#include <cstdio>

#include "tools/atomic_file.h"

namespace pells_tool {

namespace {

void check(bool succeeded) {
    if (succeeded)
        return;
    if (errno == EPIPE)
        throw ReaderGone();
    throw pells::FileError("standard output", errno);
}

}  // namespace

void writeOut(const std::string& text) {
    writeOut(text.data(), text.size());
}

void writeOut(const char* bytes, std::size_t count) {
    check(count == 0 || std::fwrite(bytes, 1, count, stdout) == count);
}

void flushOut() {
    check(std::fflush(stdout) == 0);
}

}  // namespace pells_tool
