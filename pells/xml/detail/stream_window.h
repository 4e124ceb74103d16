#pragma once

#include <cstdint>
#include <istream>
#include <limits>
#include <streambuf>

#include "pells/core/detail/get_area.h"

namespace pells::detail {

/// The characters of an input stream, seen through the get area of its buffer: `next` to `limit`
/// are at hand, and more() asks the buffer for others.
///
/// Characters are taken by moving `next` up to `limit`. The stream learns of it from release();
/// between release() and attach() it belongs to others. Buffers without a get area work, too, one
/// character at a time. No character is taken from the buffer that was not used.
class StreamWindow {
public:
    explicit StreamWindow(std::istream& source) : in(source), state(source) {}
    StreamWindow(const StreamWindow&) = delete;
    StreamWindow& operator=(const StreamWindow&) = delete;

    /// Takes up the stream where it stands; false, and failbit, when it is not good.
    bool attach();

    /// Leaves the stream at `next`. To be called once after each attach() that succeeded.
    void release();

    /// Whether there is a character at `next`. The characters before it may be gone afterwards.
    bool more() { return next != limit || refill(); }

    /// Goes on to the characters behind `limit`, where `next` must be.
    ///
    /// \return false at the end of the stream, which gets its state bits as from a formatted read.
    /// \throws what the buffer throws when the stream's exceptions() ask for badbit, and
    ///         std::ios_base::failure when they ask for a bit that gets set.
    /// \throws XMLTokenizer::TooLarge behind the end that was set.
    bool refill();

    /// Uses the characters up to a place, and counts them.
    void takeTo(const char* place) {
        used += static_cast<std::uint64_t>(place - next);
        next = place;
    }

    /// Counts the characters that were used since attach(), or since the last call, without
    /// takeTo().
    void count() {
        used += static_cast<std::uint64_t>(next - begin);
        begin = next;
    }

    /// How many characters were counted since the window was made.
    std::uint64_t getPosition() const { return used; }

    /// Sets how far characters may be used.
    void setEnd(std::uint64_t position) { end = position; }

    bool isBehindEnd() const { return used > end; }

    /// Says that there is more behind the end. \throws XMLTokenizer::TooLarge
    [[noreturn]] void refuseLength() const;

    const char* next = nullptr;
    const char* limit = nullptr;

private:
    bool isSingle() const { return limit == &single + 1; }
    bool refuse();
    void consume();
    void releaseSingle();
    void look(char character);
    void bufferThrew();

    std::istream& in;
    /// The stream again, without the detour through its virtual base.
    std::ios& state;
    std::streambuf* buffer = nullptr;
    /// Where counting began.
    const char* begin = nullptr;
    std::uint64_t used = 0;
    std::uint64_t end = std::numeric_limits<std::uint64_t>::max();
    /// Stands in for the get area of a buffer that has none.
    char single = 0;
};

// Every token goes through these.

inline bool StreamWindow::attach() {
    if (!state.good())
        return refuse();
    buffer = state.rdbuf();
    begin = next = GetArea::next(*buffer);
    limit = GetArea::limit(*buffer);
    return true;
}

inline void StreamWindow::release() {
    if (isSingle())
        releaseSingle();
    else if (next)
        GetArea::moveTo(*buffer, next);
}

}  // namespace pells::detail
