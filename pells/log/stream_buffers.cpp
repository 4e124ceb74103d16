#include "pells/log/stream_buffers.h"

#include <cstring>

#include "pells/platform/debugger.h"

namespace pells {

template class simple_streambuf<char>;
template class simple_istreambuf<char>;
template class simple_ostreambuf<char>;
template class tee_ostreambuf<char>;

debug_ostreambuf::debug_ostreambuf() = default;

debug_ostreambuf::~debug_ostreambuf() {
    syncBeforeEnd();
}

bool debug_ostreambuf::write(char* text, long count) {
    // A copy with an end; on the stack, so that lines reach the debugger when memory has run out.
    char piece[defaultSize + 1];
    const std::size_t size = static_cast<std::size_t>(count);
    std::memcpy(piece, text, size);
    piece[size] = '\0';
    platform::debuggerOutput(piece);
    return true;
}

debugostream::debugostream() : simple_ostream<char>(new debug_ostreambuf) {}

debugostream::~debugostream() = default;

}  // namespace pells
