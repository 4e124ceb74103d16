#pragma once

#include <exception>
#include <fstream>
#include <istream>
#include <string>

#include "pells/core/smart_base.h"

namespace pells {

/// Holds, or points at, one input stream. Keep the container alive while reading.
class PELLS_API baseiStreamContainer : public smart_base {
public:
    ~baseiStreamContainer() override;

    /// The stream to read from; valid while the container lives.
    virtual std::istream& getStream() = 0;
};

/// A file of its own, closed with the container. Containers of one file read independently.
class PELLS_API iTemporaryStreamContainer : public baseiStreamContainer {
public:
    /// There is no regular file of that name that may be read.
    struct PELLS_API CantOpen : public std::exception {
        ~CantOpen() override;
        const char* what() const noexcept override;
    };

    /// Opens a regular file for reading, in binary mode.
    ///
    /// \throws CantOpen when that fails.
    explicit iTemporaryStreamContainer(const std::string& path);
    ~iTemporaryStreamContainer() override;

    std::istream& getStream() override;

private:
    std::ifstream file;
};

/// A stream that belongs to somebody else and outlives the container.
class PELLS_API iExistingStreamContainer : public baseiStreamContainer {
public:
    /// \param existingStream not owned; outlives the container.
    explicit iExistingStreamContainer(std::istream& existingStream);
    ~iExistingStreamContainer() override;

    std::istream& getStream() override;

private:
    std::istream* stream;
};

}  // namespace pells
