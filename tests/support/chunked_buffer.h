#pragma once

#include <algorithm>
#include <cstring>
#include <memory>
#include <stdexcept>
#include <streambuf>
#include <string>

namespace pells_test {

/// Gives a text in pieces of a chosen size. Each piece is a block of its own that goes when the
/// next one comes, so that an address sanitizer sees who looks past its ends or back at it.
class ChunkedBuffer : public std::streambuf {
public:
    /// \param size characters in a piece; 0: the buffer shows no piece, only single characters.
    /// \param breaks whether it throws where the text ends.
    ChunkedBuffer(const std::string& whole, std::size_t size, bool breaks = false)
        : text(whole), chunk(size), damaged(breaks) {}

    /// Characters that were taken from the buffer.
    std::size_t taken() const { return given - static_cast<std::size_t>(egptr() - gptr()); }

protected:
    int_type underflow() override {
        if (given == text.size())
            return end();
        if (chunk != 0) {
            const std::size_t size = std::min(chunk, text.size() - given);
            piece.reset(new char[size]);
            std::memcpy(piece.get(), text.data() + given, size);
            given += size;
            setg(piece.get(), piece.get(), piece.get() + size);
            return traits_type::to_int_type(*gptr());
        }
        return traits_type::to_int_type(text[given]);
    }

    int_type uflow() override {
        if (chunk != 0)
            return std::streambuf::uflow();
        return given == text.size() ? end() : traits_type::to_int_type(text[given++]);
    }

private:
    int_type end() const {
        return damaged ? throw std::runtime_error("damaged") : traits_type::eof();
    }

    const std::string& text;
    std::size_t chunk;
    bool damaged;
    std::size_t given = 0;
    std::unique_ptr<char[]> piece;
};

}  // namespace pells_test
