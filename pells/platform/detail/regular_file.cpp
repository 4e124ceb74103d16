#include "pells/platform/detail/regular_file.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <sys/types.h>

#include <algorithm>
#include <cerrno>
#include <limits>

#if defined(_WIN32)
#include <io.h>
#else
#include <unistd.h>
#endif

namespace pells::detail {

namespace {

/// More than this some systems refuse to transfer in one call.
const std::size_t mostAtOnce = std::size_t{1} << 30;

bool isName(const std::string& path) {
    errno = ENOENT;
    return path.find('\0') == std::string::npos;
}

/// Makes a system call until no signal interrupts it.
template <class Call>
auto uninterrupted(Call call) {
    auto result = call();
    while (result < 0 && errno == EINTR)
        result = call();
    return result;
}

#if defined(_WIN32)

typedef struct _stat64 Status;

int statusOf(int descriptor, Status& status) {
    return ::_fstat64(descriptor, &status);
}

bool isRegular(const Status& status) {
    return (status.st_mode & _S_IFMT) == _S_IFREG;
}

int closeDescriptor(int descriptor) {
    return ::_close(descriptor);
}

#else

typedef struct stat Status;

int statusOf(int descriptor, Status& status) {
    return ::fstat(descriptor, &status);
}

bool isRegular(const Status& status) {
    return S_ISREG(status.st_mode);
}

int closeDescriptor(int descriptor) {
    return ::close(descriptor);
}

#endif

}  // namespace

RegularFile::~RegularFile() {
    close();
}

bool RegularFile::openToRead(const std::string& path) {
    close();
    if (!isName(path))
        return false;
#if defined(_WIN32)
    descriptor = ::_open(path.c_str(), _O_RDONLY | _O_BINARY | _O_NOINHERIT);
#else
    descriptor = uninterrupted(
        [&path] { return ::open(path.c_str(), O_RDONLY | O_CLOEXEC | O_NONBLOCK | O_NOCTTY); });
#endif
    return acceptRegular();
}

bool RegularFile::openToWrite(const std::string& path, WriteMode mode) {
    close();
    if (!isName(path))
        return false;
#if defined(_WIN32)
    const int flags = _O_WRONLY | _O_CREAT | _O_TEXT | _O_NOINHERIT;
    descriptor = ::_open(path.c_str(), flags | (mode == APPEND ? _O_APPEND : _O_TRUNC),
                         _S_IREAD | _S_IWRITE);
#else
    const int flags = O_WRONLY | O_CREAT | O_CLOEXEC | O_NONBLOCK | O_NOCTTY | O_NOFOLLOW |
                      (mode == APPEND ? O_APPEND : O_TRUNC);
    descriptor = uninterrupted([&path, flags] { return ::open(path.c_str(), flags, 0666); });
#endif
    // A log is opened for every line: then the look would cost an eighth of the time, and a pipe
    // that took the file's place loses nothing and, not waiting, blocks nobody.
    return mode == APPEND ? isOpen() : acceptRegular();
}

/// Keeps the descriptor if it is that of a regular file.
bool RegularFile::acceptRegular() {
    Status status;
    if (isOpen() && statusOf(descriptor, status) == 0 && isRegular(status))
        return true;
    const int reason = isOpen() ? EINVAL : errno;
    close();
    errno = reason;
    return false;
}

bool RegularFile::close() {
    if (!isOpen())
        return true;
    const bool closed = closeDescriptor(descriptor) == 0;
    descriptor = -1;
    return closed;
}

std::ptrdiff_t RegularFile::readAt(std::uint64_t offset, char* into, std::size_t room) const {
    const std::size_t wanted = std::min(room, mostAtOnce);
    if (offset > static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max()))
        return 0;
#if defined(_WIN32)
    if (::_lseeki64(descriptor, static_cast<std::int64_t>(offset), SEEK_SET) < 0)
        return -1;
    return ::_read(descriptor, into, static_cast<unsigned>(wanted));
#else
    return uninterrupted(
        [&] { return ::pread(descriptor, into, wanted, static_cast<off_t>(offset)); });
#endif
}

bool RegularFile::write(const char* bytes, std::size_t count) {
    while (count != 0) {
        const std::size_t piece = std::min(count, mostAtOnce);
#if defined(_WIN32)
        const auto written = ::_write(descriptor, bytes, static_cast<unsigned>(piece));
#else
        const auto written =
            uninterrupted([this, bytes, piece] { return ::write(descriptor, bytes, piece); });
#endif
        if (written <= 0)
            return false;
        bytes += written;
        count -= static_cast<std::size_t>(written);
    }
    return true;
}

bool RegularFile::identify(Identity& identity) const {
    Status status;
    if (!isOpen() || statusOf(descriptor, status) != 0)
        return false;
    identity = {};
    identity.device = static_cast<std::uint64_t>(status.st_dev);
    identity.number = static_cast<std::uint64_t>(status.st_ino);
    identity.size = static_cast<std::uint64_t>(status.st_size);
    identity.writeTime = status.st_mtime;
    identity.changeTime = status.st_ctime;
#if defined(__linux__)
    identity.writeFraction = status.st_mtim.tv_nsec;
    identity.changeFraction = status.st_ctim.tv_nsec;
#endif
    return true;
}

}  // namespace pells::detail
