#include "pells/xml/detail/stream_window.h"

#include <string>

#include "pells/xml/tokenizer.h"

namespace pells::detail {

namespace {

typedef std::char_traits<char> Traits;

}  // namespace

bool StreamWindow::refuse() {
    state.setstate(std::ios_base::failbit);
    return false;
}

void StreamWindow::refuseLength() const {
    throw XMLTokenizer::TooLarge("XML document goes on beyond byte " + std::to_string(end));
}

bool StreamWindow::refill() {
    count();
    if (isBehindEnd())
        refuseLength();
    // Flushes the stream that this one is tied to, as it may wait for an answer.
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
        state.setstate(std::ios_base::eofbit | std::ios_base::failbit);
        return false;
    }
    look(Traits::to_char_type(character));
    return true;
}

/// Tells the buffer which characters were used; none are at hand afterwards.
void StreamWindow::consume() {
    const char* const reached = next;
    const bool wasSingle = isSingle();
    count();
    begin = next = limit = nullptr;
    if (wasSingle && reached == &single + 1)
        buffer->sbumpc();
    else if (!wasSingle && reached)
        GetArea::moveTo(*buffer, reached);
}

void StreamWindow::releaseSingle() {
    try {
        consume();
    } catch (...) {
        bufferThrew();
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
    begin = next;
}

/// To be called where an exception of the buffer is handled.
void StreamWindow::bufferThrew() {
    try {
        state.setstate(std::ios_base::badbit);
    } catch (const std::ios_base::failure&) {
        // The buffer's own exception says more.
    }
    if ((state.exceptions() & std::ios_base::badbit) != 0)
        throw;
}

}  // namespace pells::detail
