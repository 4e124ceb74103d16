#include "pells/asset/stream_container.h"

#include "pells/asset/detail/regular_file.h"

namespace pells {

baseiStreamContainer::~baseiStreamContainer() = default;

iTemporaryStreamContainer::CantOpen::~CantOpen() = default;

const char* iTemporaryStreamContainer::CantOpen::what() const noexcept {
    return "no regular file of that name can be opened";
}

iTemporaryStreamContainer::iTemporaryStreamContainer(const std::string& path) {
    detail::openRegularFile(file, path);
    if (!file.is_open())
        throw CantOpen();
}

iTemporaryStreamContainer::~iTemporaryStreamContainer() = default;

std::istream& iTemporaryStreamContainer::getStream() {
    return file;
}

iExistingStreamContainer::iExistingStreamContainer(std::istream& existingStream)
    : stream(&existingStream) {}

iExistingStreamContainer::~iExistingStreamContainer() = default;

std::istream& iExistingStreamContainer::getStream() {
    return *stream;
}

}  // namespace pells
