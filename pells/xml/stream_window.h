#pragma once

#include <istream>
#include <streambuf>

namespace pells {

/// The characters of an input stream, seen through the get area of its buffer: `next` to `limit`
/// are at hand, and more() asks the buffer for others.
///
/// Characters are taken by moving `next` up to `limit`. The stream learns of it from release();
/// between release() and attach() it belongs to others. Buffers without a get area work, too, one
/// character at a time. Never takes a character from the buffer that was not used.
class StreamWindow {
public:
    explicit StreamWindow(std::istream& source) : in(source) {}
    StreamWindow(const StreamWindow&) = delete;
    StreamWindow& operator=(const StreamWindow&) = delete;

    /// Takes up the stream where it stands; false, and failbit, when it is not good.
    bool attach();

    /// Leaves the stream at `next`.
    void release();

    /// Whether there is a character at `next`. The characters before it may be gone afterwards.
    bool more() { return next != limit || refill(); }

    /// Goes on to the characters behind `limit`, where `next` must be.
    ///
    /// \return false at the end of the stream, which gets its state bits as from a formatted read.
    /// \throws what the buffer throws when the stream's exceptions() ask for badbit, and
    ///         std::ios_base::failure when they ask for a bit that is set.
    bool refill();

    const char* next = nullptr;
    const char* limit = nullptr;

private:
    void consume();
    void look(char character);
    void bufferThrew();

    std::istream& in;
    std::streambuf* buffer = nullptr;
    /// Stands in for the get area of a buffer that has none.
    char single = 0;
};

}  // namespace pells
