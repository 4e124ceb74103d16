#include "pells/platform/debugger.h"

#include <cstdio>

#include "pells/platform/counter.h"

#if defined(_WIN32)
#include <windows.h>
#else
#include <cstdlib>
#include <cstring>
#endif

namespace pells {
namespace platform {

namespace {

DebuggerSink* currentSink = nullptr;

#if defined(_WIN32)

void defaultOutput(const char* text) {
    OutputDebugStringA(text);
}

#else

/// Whether another process traces this one, as the "TracerPid" line of /proc/self/status says.
bool lookForDebugger() {
    std::FILE* const status = std::fopen("/proc/self/status", "r");
    if (!status)
        return false;
    static const char key[] = "TracerPid:";
    bool traced = false;
    char line[256];
    while (std::fgets(line, sizeof line, status)) {
        if (std::strncmp(line, key, sizeof key - 1) == 0) {
            traced = std::strtol(line + sizeof key - 1, nullptr, 10) != 0;
            break;
        }
    }
    std::fclose(status);
    return traced;
}

bool debuggerAttached() {
    // Reading the status costs as much as writing many log lines, so an answer serves for a second.
    static bool attached = lookForDebugger();
    static std::uint64_t asked = counter();
    const std::uint64_t now = counter();
    if (now - asked >= counterFrequency()) {
        attached = lookForDebugger();
        asked = now;
    }
    return attached;
}

void defaultOutput(const char* text) {
    if (debuggerAttached())
        std::fputs(text, stderr);
}

#endif

}  // namespace

DebuggerSink::~DebuggerSink() {
    if (currentSink == this)
        currentSink = nullptr;
}

DebuggerSink* setDebuggerSink(DebuggerSink* sink) {
    DebuggerSink* const previous = currentSink;
    currentSink = sink;
    return previous;
}

void debuggerOutput(const char* text) {
    if (currentSink)
        currentSink->write(text);
    else
        defaultOutput(text);
}

}  // namespace platform
}  // namespace pells
