// Definitions of the templates in stream_buffers.h.

#pragma once

#include <stdexcept>

#include "pells/log/stream_buffers.h"

namespace pells {

template <class C, class Traits>
simple_streambuf<C, Traits>::simple_streambuf(long size)
    : block(size > 0 ? static_cast<typename std::vector<C>::size_type>(size)
                     : throw std::length_error("simple_streambuf: size must be positive")) {}

template <class C, class Traits>
simple_streambuf<C, Traits>::~simple_streambuf() = default;

template <class C, class Traits>
long simple_streambuf<C, Traits>::bufferSize() const {
    return static_cast<long>(block.size());
}

template <class C, class Traits>
C* simple_streambuf<C, Traits>::buffer() {
    return block.data();
}

template <class C, class Traits>
simple_istreambuf<C, Traits>::simple_istreambuf(long size) : simple_streambuf<C, Traits>(size) {
    C* const start = this->buffer();
    this->setg(start, start, start);
}

template <class C, class Traits>
typename Traits::int_type simple_istreambuf<C, Traits>::underflow() {
    if (this->gptr() < this->egptr())
        return Traits::to_int_type(*this->gptr());

    C* const start = this->buffer();
    C* const end = start + this->bufferSize();
    C* position = start;
    // A block of one character has no room for one to put back.
    if (this->gptr() > this->eback() && end - start > 1) {
        *start = this->gptr()[-1];
        ++position;
    }
    const long count = read(position, static_cast<long>(end - position));
    if (count < 0)
        return Traits::eof();
    this->setg(start, position, position + count);
    return count == 0 ? Traits::eof() : Traits::to_int_type(*position);
}

template <class C, class Traits>
simple_ostreambuf<C, Traits>::simple_ostreambuf(long size) : simple_streambuf<C, Traits>(size) {
    emptyBuffer();
}

template <class C, class Traits>
int simple_ostreambuf<C, Traits>::sync() {
    const long pending = static_cast<long>(this->pptr() - this->pbase());
    if (pending > 0 && !write(this->pbase(), pending))
        return -1;
    emptyBuffer();
    return xsync() ? 0 : -1;
}

template <class C, class Traits>
typename Traits::int_type simple_ostreambuf<C, Traits>::overflow(typename Traits::int_type ch) {
    const bool isCharacter = !Traits::eq_int_type(ch, Traits::eof());
    if (isCharacter) {
        // Text that could not be written may fill the block to its last character.
        if (this->pptr() == this->buffer() + this->bufferSize() && sync() == -1)
            return Traits::eof();
        *this->pptr() = Traits::to_char_type(ch);
        this->pbump(1);
    }
    if (sync() == -1) {
        if (this->pptr() > this->epptr()) {
            // The base class must not count room that is not there: the area ends with the text.
            const int pending = static_cast<int>(this->pptr() - this->pbase());
            this->setp(this->pbase(), this->pptr());
            this->pbump(pending);
        }
        return Traits::eof();
    }
    return isCharacter ? ch : typename Traits::int_type(0);
}

template <class C, class Traits>
std::streamsize simple_ostreambuf<C, Traits>::xsputn(const C* text, std::streamsize count) {
    if (count < 0 || count > this->epptr() - this->pptr())
        return std::basic_streambuf<C, Traits>::xsputn(text, count);
    Traits::copy(this->pptr(), text, static_cast<std::size_t>(count));
    this->pbump(static_cast<int>(count));
    return count;
}

template <class C, class Traits>
int simple_ostreambuf<C, Traits>::close() {
    return sync();
}

template <class C, class Traits>
bool simple_ostreambuf<C, Traits>::xsync() {
    return true;
}

template <class C, class Traits>
void simple_ostreambuf<C, Traits>::syncBeforeEnd() noexcept {
    try {
        sync();
    } catch (...) {
        // Whoever could be told is being destroyed.
    }
}

template <class C, class Traits>
void simple_ostreambuf<C, Traits>::emptyBuffer() {
    C* const start = this->buffer();
    this->setp(start, start + this->bufferSize() - 1);
}

template <class C, class Traits>
tee_ostreambuf<C, Traits>::tee_ostreambuf(std::basic_ostream<C, Traits>& firstTarget,
                                          std::basic_ostream<C, Traits>& secondTarget)
    : first(&firstTarget), second(&secondTarget) {}

template <class C, class Traits>
tee_ostreambuf<C, Traits>::~tee_ostreambuf() {
    this->syncBeforeEnd();
}

template <class C, class Traits>
bool tee_ostreambuf<C, Traits>::write(C* text, long count) {
    first->write(text, count);
    second->write(text, count);
    return eitherWorks();
}

template <class C, class Traits>
bool tee_ostreambuf<C, Traits>::xsync() {
    first->flush();
    second->flush();
    return eitherWorks();
}

template <class C, class Traits>
bool tee_ostreambuf<C, Traits>::eitherWorks() const {
    return !first->fail() || !second->fail();
}

}  // namespace pells
