#include <fcntl.h>
#include <signal.h>
#include <sys/stat.h>
#include <unistd.h>

#include <atomic>
#include <cerrno>
#include <cstring>
#include <mutex>

#include "pells/kit/file/atomic_file.h"
#include "pells/kit/file/temporary_file.h"

namespace pells {
namespace kit {
namespace detail {

namespace {

#if !defined(O_PATH)
const int O_PATH = O_RDONLY;
#endif

/// Keeps signals from the thread while a file is there that nobody has noted yet.
class SignalsHeld {
public:
    SignalsHeld() {
        sigset_t all;
        ::sigfillset(&all);
        ::pthread_sigmask(SIG_SETMASK, &all, &before);
    }
    SignalsHeld(const SignalsHeld&) = delete;
    SignalsHeld& operator=(const SignalsHeld&) = delete;
    ~SignalsHeld() { ::pthread_sigmask(SIG_SETMASK, &before, nullptr); }

private:
    sigset_t before;
};

/// The temporary files that there are, for signal handlers: nothing here allocates or locks on
/// their side.
struct Slot {
    std::atomic<bool> isUsed{false};
    int folder = -1;
    char name[64] = "";
};

const std::size_t slotCount = 16;
Slot slots[slotCount];
std::mutex slotsMutex;

/// \return the slot, or slotCount when all are taken. To be called with signals held.
std::size_t note(int folder, const std::string& name) {
    const std::lock_guard<std::mutex> lock(slotsMutex);
    for (std::size_t i = 0; i < slotCount; ++i) {
        Slot& slot = slots[i];
        if (slot.isUsed || name.size() >= sizeof slot.name)
            continue;
        slot.folder = folder;
        std::memcpy(slot.name, name.c_str(), name.size() + 1);
        slot.isUsed = true;
        return i;
    }
    return slotCount;
}

void forget(std::size_t slot) {
    if (slot < slotCount)
        slots[slot].isUsed = false;
}

/// Makes a name survive a power cut. There is nothing to be done where a file system cannot.
void syncFolder(int folder) {
    const int descriptor = ::openat(folder, ".", O_RDONLY | O_DIRECTORY | O_CLOEXEC);
    if (descriptor < 0)
        return;
    static_cast<void>(::fsync(descriptor));
    ::close(descriptor);
}

}  // namespace

TemporaryFile::TemporaryFile(const std::string& destinationPath) : destination(destinationPath) {
    const std::string::size_type slash = destination.rfind('/');
    const std::string path = slash == std::string::npos ? "." : destination.substr(0, slash + 1);
    destinationName = slash == std::string::npos ? destination : destination.substr(slash + 1);
    folder = ::open(path.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC);
    if (folder < 0)
        throw FileError(destination, errno);
    // What replaces a file may be for fewer eyes than the mask says.
    struct stat old;
    const bool replaces = ::fstatat(folder, destinationName.c_str(), &old, 0) == 0;
    int descriptor = -1;
    const SignalsHeld held;
    do {
        name = randomTemporaryName();
        descriptor = ::openat(folder, name.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC,
                              replaces ? 0600 : 0666);
    } while (descriptor < 0 && errno == EEXIST);
    int reason = errno;
    if (descriptor >= 0) {
        file = ::fdopen(descriptor, "wb");
        reason = errno;
    }
    if (!file) {
        if (descriptor >= 0) {
            ::close(descriptor);
            ::unlinkat(folder, name.c_str(), 0);
        }
        ::close(folder);
        throw FileError(destination, reason);
    }
    slot = note(folder, name);
}

TemporaryFile::~TemporaryFile() {
    if (file)
        std::fclose(file);
    const SignalsHeld held;
    forget(slot);
    if (!name.empty())
        ::unlinkat(folder, name.c_str(), 0);
    ::close(folder);
}

void TemporaryFile::rename() {
    keepPermissions();
    closeFile();
    {
        const SignalsHeld held;
        if (::renameat(folder, name.c_str(), folder, destinationName.c_str()) != 0)
            throw FileError(destination, errno);
        forget(slot);
        name.clear();
    }
    syncFolder(folder);
}

void TemporaryFile::keepPermissions() {
    struct stat old;
    if (::fstatat(folder, destinationName.c_str(), &old, AT_SYMLINK_NOFOLLOW) != 0)
        return;
    if (!S_ISREG(old.st_mode))
        throw FileError(destination, std::string("Not a regular file"));
    const int descriptor = ::fileno(file);
    // Not everybody may; before the mode, as it takes bits away.
    const bool keepsGroup = ::fchown(descriptor, old.st_uid, old.st_gid) == 0 ||
                            ::fchown(descriptor, static_cast<uid_t>(-1), old.st_gid) == 0;
    mode_t mode = old.st_mode & 07777;
    // Another group gets no more than everybody.
    if (!keepsGroup)
        mode &= ~static_cast<mode_t>(070) | (mode & 07) << 3;
    if (::fchmod(descriptor, mode) != 0)
        throw FileError(destination, errno);
}

void TemporaryFile::closeFile() {
    const bool synced = std::fflush(file) == 0 && ::fsync(::fileno(file)) == 0;
    const int syncError = errno;
    const bool closed = std::fclose(file) == 0;
    file = nullptr;
    if (!synced || !closed)
        throw FileError(destination, synced ? errno : syncError);
}

void TemporaryFile::removeOnSignal() {
    for (Slot& slot : slots) {
        if (slot.isUsed)
            ::unlinkat(slot.folder, slot.name, 0);
    }
}

}  // namespace detail
}  // namespace kit
}  // namespace pells
