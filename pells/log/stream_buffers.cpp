#include "pells/log/stream_buffers.h"

#include "pells/platform/debugger.h"

namespace pells {

template class simple_streambuf<char>;
template class simple_istreambuf<char>;
template class simple_ostreambuf<char>;
template class tee_ostreambuf<char>;

debug_ostreambuf::debug_ostreambuf() = default;

debug_ostreambuf::~debug_ostreambuf() {
    sync();
}

bool debug_ostreambuf::write(char* text, long count) {
    const std::string piece(text, static_cast<std::string::size_type>(count));
    platform::debuggerOutput(piece.c_str());
    return true;
}

debugostream::debugostream() : simple_ostream<char>(new debug_ostreambuf) {}

debugostream::~debugostream() = default;

}  // namespace pells
