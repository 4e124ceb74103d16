#pragma once

#include <string>
#include <vector>

#include "pells/platform/debugger.h"

namespace pells_tool {

/// Gathers what the library logs under "error" while it lives: the reasons of its failures.
///
/// There are none when the rules for log tags switch "error" off. The sink that was set before gets
/// all lines, too.
class ErrorLines : public pells::platform::DebuggerSink {
public:
    ErrorLines();
    ~ErrorLines() override;

    /// The messages since the last call, without their tag.
    std::vector<std::string> take();

    void write(const char* text) override;

private:
    DebuggerSink* previous;
    std::string gathered;
};

}  // namespace pells_tool
