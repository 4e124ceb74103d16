#pragma once

#include "pells/core/export.h"

namespace pells {
namespace platform {

/// Receives what the library sends to the debugger.
///
/// A sink that dies while it is set withdraws itself, so that the log may outlive the application's
/// static objects.
class PELLS_API DebuggerSink {
public:
    DebuggerSink(const DebuggerSink&) = delete;
    DebuggerSink& operator=(const DebuggerSink&) = delete;
    virtual ~DebuggerSink();

    /// Takes a piece of text, zero-terminated, not necessarily whole lines. Must not log.
    virtual void write(const char* text) = 0;

protected:
    DebuggerSink() = default;
};

/// Sends all further debugger output to a sink; null restores the default.
///
/// \param sink stays the caller's.
/// \return the sink that was set before, or null.
PELLS_API DebuggerSink* setDebuggerSink(DebuggerSink* sink);

/// Shows a text to the developer: through the sink if one is set, else on standard error while a
/// debugger is attached (looked up at most once a second), else not at all. On Windows the
/// default is the system's debugger output.
PELLS_API void debuggerOutput(const char* text);

}  // namespace platform
}  // namespace pells
