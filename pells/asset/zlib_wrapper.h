#pragma once

#include <zlib.h>

#include <stdexcept>
#include <string>

#include "pells/core/export.h"

namespace pells {

/// A zlib stream whose results are checked; zlib's own fields are its public members.
///
/// It holds the fields and nothing else: a subclass initialises and ends the stream. Copies are
/// made field by field, so only a stream that has not been initialised may be copied.
struct PELLS_API ZlibWrapper : public z_stream_s {
    /// A zlib operation failed; what() is the text of getMessage().
    struct PELLS_API ZlibError : public std::runtime_error {
        /// \param message what check() logs and what() says.
        explicit ZlibError(const std::string& message);
        ~ZlibError() override;
    };

    /// Sets every field to zero and then the allocator; null functions stand for zlib's own.
    explicit ZlibWrapper(alloc_func allocate = nullptr, free_func release = nullptr,
                         voidpf allocatorData = nullptr);
    ZlibWrapper(const ZlibWrapper&) = default;
    ZlibWrapper& operator=(const ZlibWrapper&) = default;
    virtual ~ZlibWrapper() noexcept(false);

    /// Returns when the result of an operation is one that the caller accepts.
    ///
    /// \param what     the operation, for the message.
    /// \param result   what zlib returned.
    /// \param ok1, ok2 the accepted results; the same one twice where there is only one.
    /// \throws ZlibError for any other result, after logging its text under "error". The stream
    ///         stays as zlib left it.
    void check(const std::string& what, int result, int ok1, int ok2) const;

    /// "Class::what: Z_NAME (code)", followed by ": " and zlib's own text when `msg` has one, as in
    /// "ZlibInflater::read(): Z_DATA_ERROR (-3): incorrect header check". Codes that zlib does not
    /// have are named "unknown".
    std::string getMessage(const std::string& what, int code) const;
};

/// A zlib stream ready to inflate, from its construction to its destruction.
///
/// The caller sets `next_in`, `avail_in`, `next_out` and `avail_out` and calls zlib's inflate() and
/// inflateReset() on the object. With 15 window bits the input is in zlib's own format (RFC 1950);
/// gzip files and bare deflate data are refused as Z_DATA_ERROR.
struct PELLS_API ZlibInflater : public ZlibWrapper {
    /// \param input      the first input, or null; it is not copied.
    /// \param available  bytes of the first input.
    /// \param windowBits as for zlib's inflateInit2(): 8 to 15, the logarithm of the largest
    /// window. \param allocate, release, allocatorData as for ZlibWrapper. \throws ZlibError when
    /// zlib refuses, with Z_MEM_ERROR for instance.
    ZlibInflater(Bytef* input, uInt available, int windowBits, alloc_func allocate,
                 free_func release, voidpf allocatorData);
    ZlibInflater(const ZlibInflater&) = delete;
    ZlibInflater& operator=(const ZlibInflater&) = delete;

    /// Ends the stream.
    ///
    /// \throws ZlibError when zlib finds the stream inconsistent. While another exception is on its
    ///         way the failure is logged only.
    ~ZlibInflater() noexcept(false) override;
};

}  // namespace pells
