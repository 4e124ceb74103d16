#include "tools/process.h"

#include "tools/atomic_file.h"

#if defined(_WIN32)
#include <fcntl.h>
#include <io.h>
#include <stdio.h>
#else
#include <fcntl.h>
#include <signal.h>
#include <unistd.h>
#endif

namespace pells_tool {

#if defined(_WIN32)

void prepareProcess() {
    _setmode(_fileno(stdout), _O_BINARY);
}

void endByClosedPipe() {}

#else

namespace {

extern "C" void endBySignal(int number) {
    pells::AtomicFile::removeOnSignal();
    // The handler was reset when it was entered: this ends the process as the signal would have.
    ::raise(number);
}

/// Whether a signal ends a process that has no handler for it. Those that the process brings upon
/// itself by a fault are left to debuggers and sanitizers.
bool endsProcess(int number) {
    switch (number) {
        case SIGHUP:
        case SIGINT:
        case SIGQUIT:
        case SIGTERM:
        case SIGABRT:
        case SIGALRM:
        case SIGVTALRM:
        case SIGPROF:
        case SIGUSR1:
        case SIGUSR2:
        case SIGXCPU:
        case SIGIO:
#if defined(SIGSTKFLT)
        case SIGSTKFLT:
#endif
#if defined(SIGPWR)
        case SIGPWR:
#endif
            return true;
        default:
            return number >= SIGRTMIN;
    }
}

/// Sets a handler unless whoever started the process had the signal ignored, as nohup does.
void setHandler(int number, void (*handler)(int)) {
    struct sigaction action = {};
    if (::sigaction(number, nullptr, &action) != 0 || action.sa_handler == SIG_IGN)
        return;
    action.sa_handler = handler;
    action.sa_flags = static_cast<int>(SA_RESETHAND);
    ::sigaction(number, &action, nullptr);
}

}  // namespace

void prepareProcess() {
    // For reading only: what is written to a closed stream must fail.
    for (int descriptor = 0; descriptor <= 2; ++descriptor) {
        if (::fcntl(descriptor, F_GETFD) == -1)
            static_cast<void>(::open("/dev/null", O_RDONLY));
    }
    ::signal(SIGPIPE, SIG_IGN);
    ::signal(SIGXFSZ, SIG_IGN);
    for (int number = 1; number <= SIGRTMAX; ++number) {
        if (endsProcess(number))
            setHandler(number, &endBySignal);
    }
}

void endByClosedPipe() {
    ::signal(SIGPIPE, SIG_DFL);
    ::raise(SIGPIPE);
}

#endif

}  // namespace pells_tool
