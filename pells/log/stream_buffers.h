#pragma once

#include <istream>
#include <memory>
#include <ostream>
#include <streambuf>
#include <string>
#include <vector>

#include "pells/core/export.h"

namespace pells {

/// A stream buffer that owns one block of characters.
template <class C = char, class Traits = std::char_traits<C>>
class PELLS_TEMPLATE_API simple_streambuf : public std::basic_streambuf<C, Traits> {
public:
    simple_streambuf(const simple_streambuf&) = delete;
    simple_streambuf& operator=(const simple_streambuf&) = delete;
    ~simple_streambuf() override;

protected:
    /// Characters in a block unless another size is asked for.
    static constexpr long defaultSize = 1024;

    /// \param size characters in the block, at least 1.
    /// \throws std::length_error for a smaller size.
    explicit simple_streambuf(long size = defaultSize);

    /// The size and the start of the block.
    long bufferSize() const;
    C* buffer();

private:
    std::vector<C> block;
};

/// An input buffer that needs one operation of its subclass: read() refills it.
///
/// The last character consumed survives a refill, so one character can always be put back.
template <class C = char, class Traits = std::char_traits<C>>
class PELLS_TEMPLATE_API simple_istreambuf : public simple_streambuf<C, Traits> {
public:
    /// \param size characters in the block; 1 leaves none to put back.
    explicit simple_istreambuf(long size = simple_streambuf<C, Traits>::defaultSize);

    /// Stores up to `room` characters and returns their number; 0 or -1 when no more can be read.
    virtual long read(C* into, long room) = 0;

protected:
    typename Traits::int_type underflow() override;
};

/// An output buffer that needs one operation of its subclass: write() takes whole blocks.
///
/// A subclass calls syncBeforeEnd() in its destructor, while write() still works, so that pending
/// text is not lost.
template <class C = char, class Traits = std::char_traits<C>>
class PELLS_TEMPLATE_API simple_ostreambuf : public simple_streambuf<C, Traits> {
public:
    /// \param size characters in the block.
    explicit simple_ostreambuf(long size = simple_streambuf<C, Traits>::defaultSize);

protected:
    /// Writes the pending text; on failure returns -1 and keeps it for the next time.
    int sync() override;
    typename Traits::int_type overflow(typename Traits::int_type ch = Traits::eof()) override;
    std::streamsize xsputn(const C* text, std::streamsize count) override;

public:
    /// The same as sync().
    virtual int close();

protected:
    /// Delivers `count` characters; false when they could not be delivered.
    virtual bool write(C* text, long count) = 0;

    /// Called at the end of every sync() that wrote its text, or had none to write.
    virtual bool xsync();

    /// sync() for destructors, which nothing may leave: text that write() throws at is lost.
    void syncBeforeEnd() noexcept;

    /// Makes the whole block but its last character available; that one takes the character that
    /// overflows.
    void emptyBuffer();
};

// Declared ahead of every use as a base.
extern template class PELLS_API simple_streambuf<char>;
extern template class PELLS_API simple_istreambuf<char>;
extern template class PELLS_API simple_ostreambuf<char>;

/// Sends text to the debugger, in blocks of up to 1024 characters.
class PELLS_API debug_ostreambuf : public simple_ostreambuf<char> {
public:
    debug_ostreambuf();
    ~debug_ostreambuf() override;

protected:
    bool write(char* text, long count) override;
};

/// Copies text to two streams, which must outlive the buffer. One of them may fail: the text counts
/// as written while the other one takes it.
template <class C = char, class Traits = std::char_traits<C>>
class PELLS_TEMPLATE_API tee_ostreambuf : public simple_ostreambuf<C, Traits> {
public:
    /// Neither is owned; both outlive the buffer.
    tee_ostreambuf(std::basic_ostream<C, Traits>& firstTarget,
                   std::basic_ostream<C, Traits>& secondTarget);
    ~tee_ostreambuf() override;

protected:
    bool write(C* text, long count) override;
    bool xsync() override;

private:
    bool eitherWorks() const;

    std::basic_ostream<C, Traits>* first;
    std::basic_ostream<C, Traits>* second;
};

/// An output stream that owns its buffer.
template <class C = char, class Traits = std::char_traits<C>,
          class Buffer = simple_ostreambuf<C, Traits>>
class PELLS_TEMPLATE_API simple_ostream : public std::basic_ostream<C, Traits> {
public:
    /// Takes over a buffer made with new.
    explicit simple_ostream(Buffer* ownBuffer)
        : std::basic_ostream<C, Traits>(ownBuffer), owned(ownBuffer) {}
    ~simple_ostream() override = default;

protected:
    /// The buffer that the stream owns.
    Buffer& ownBuffer() const { return *owned; }

private:
    std::unique_ptr<Buffer> owned;
};

/// An input stream that owns its buffer.
template <class C = char, class Traits = std::char_traits<C>,
          class Buffer = simple_istreambuf<C, Traits>>
class PELLS_TEMPLATE_API simple_istream : public std::basic_istream<C, Traits> {
public:
    /// Takes over a buffer made with new.
    explicit simple_istream(Buffer* ownBuffer)
        : std::basic_istream<C, Traits>(ownBuffer), owned(ownBuffer) {}
    ~simple_istream() override = default;

protected:
    /// The buffer that the stream owns.
    Buffer& ownBuffer() const { return *owned; }

private:
    std::unique_ptr<Buffer> owned;
};

extern template class PELLS_API tee_ostreambuf<char>;

/// An output stream to the debugger.
class PELLS_API debugostream : public simple_ostream<char> {
public:
    debugostream();
    ~debugostream() override;
};

/// An output stream that copies to two others, which must outlive it.
template <class C = char, class Traits = std::char_traits<C>>
class PELLS_TEMPLATE_API tee_ostream : public simple_ostream<C, Traits> {
public:
    /// Neither is owned; both outlive the stream.
    tee_ostream(std::basic_ostream<C, Traits>& firstTarget,
                std::basic_ostream<C, Traits>& secondTarget)
        : simple_ostream<C, Traits>(new tee_ostreambuf<C, Traits>(firstTarget, secondTarget)) {}
};

}  // namespace pells

#include "pells/log/stream_buffers.inl"
