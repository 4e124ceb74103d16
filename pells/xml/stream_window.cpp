#include "pells/xml/stream_window.h"

namespace pells {

namespace {

/// The get area of any stream buffer. A derived class may name the protected members, and a pointer
/// to a member of the base fits every buffer.
struct GetArea : std::streambuf {
    static char* next(const std::streambuf& buffer) { return (buffer.*&GetArea::gptr)(); }
    static char* limit(const std::streambuf& buffer) { return (buffer.*&GetArea::egptr)(); }
    static void moveTo(std::streambuf& buffer, const char* position) {
        // Not gbump(), whose int does not reach across large areas.
        char* const start = (buffer.*&GetArea::eback)();
        (buffer.*&GetArea::setg)(start, start + (position - start), limit(buffer));
    }
};

typedef std::char_traits<char> Traits;

}  // namespace

bool StreamWindow::attach() {
    if (!in.good()) {
        in.setstate(std::ios_base::failbit);
        return false;
    }
    buffer = in.rdbuf();
    next = GetArea::next(*buffer);
    limit = GetArea::limit(*buffer);
    return true;
}

void StreamWindow::release() {
    try {
        consume();
    } catch (...) {
        bufferThrew();
    }
}

bool StreamWindow::refill() {
    // Flushes the stream that this one is tied to.
    const std::istream::sentry ready(in, true);
    if (!ready)
        return false;
    Traits::int_type character = Traits::eof();
    try {
        consume();
        character = buffer->sgetc();
    } catch (...) {
        bufferThrew();
        return false;
    }
    if (Traits::eq_int_type(character, Traits::eof())) {
        in.setstate(std::ios_base::eofbit | std::ios_base::failbit);
        return false;
    }
    look(Traits::to_char_type(character));
    return true;
}

/// Tells the buffer which characters were used; none are at hand afterwards.
void StreamWindow::consume() {
    const char* const used = next;
    const bool isSingle = limit == &single + 1;
    next = limit = nullptr;
    if (isSingle) {
        if (used != &single)
            buffer->sbumpc();
    } else if (used != nullptr) {
        GetArea::moveTo(*buffer, used);
    }
}

/// Sees the buffer's characters, of which the first one is known.
void StreamWindow::look(char character) {
    next = GetArea::next(*buffer);
    limit = GetArea::limit(*buffer);
    if (next == limit) {
        single = character;
        next = &single;
        limit = &single + 1;
    }
}

/// To be called where an exception of the buffer is handled.
void StreamWindow::bufferThrew() {
    try {
        in.setstate(std::ios_base::badbit);
    } catch (const std::ios_base::failure&) {
        // The buffer's own exception says more.
    }
    if ((in.exceptions() & std::ios_base::badbit) != 0)
        throw;
}

}  // namespace pells
