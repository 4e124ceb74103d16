#pragma once

#include <streambuf>

namespace pells::detail {

/// The get area of any stream buffer: the characters that it has at hand.
///
/// A derived class may name the protected members, and a pointer to a member of the base fits every
/// buffer.
struct GetArea : std::streambuf {
    static char* next(const std::streambuf& buffer) { return (buffer.*&GetArea::gptr)(); }
    static char* limit(const std::streambuf& buffer) { return (buffer.*&GetArea::egptr)(); }

    /// Counts the characters before a position in the area as read.
    static void moveTo(std::streambuf& buffer, const char* position) {
        // Not gbump(), whose int does not reach across large areas.
        char* const start = (buffer.*&GetArea::eback)();
        (buffer.*&GetArea::setg)(start, start + (position - start), limit(buffer));
    }
};

}  // namespace pells::detail
