#pragma once

#include <string>

#include "pells/platform/debugger.h"

namespace pells_test {

/// What the debugger is given while this exists.
struct DebuggerText : pells::platform::DebuggerSink {
    DebuggerText() { pells::platform::setDebuggerSink(this); }
    void write(const char* text) override { received += text; }
    bool has(const std::string& text) const { return received.find(text) != std::string::npos; }

    std::string received;
};

}  // namespace pells_test
