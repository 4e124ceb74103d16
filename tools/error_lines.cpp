#include "tools/error_lines.h"

#include <sstream>

#include "pells/log/log.h"

namespace pells_tool {

ErrorLines::ErrorLines() : previous(pells::platform::setDebuggerSink(this)) {}

ErrorLines::~ErrorLines() {
    pells::platform::setDebuggerSink(previous);
}

std::vector<std::string> ErrorLines::take() {
    static const std::string tag = "error: ";
    // The log hands its text on in blocks.
    pells::Log::instance().getStream().flush();
    std::istringstream text(gathered);
    gathered.clear();
    std::vector<std::string> messages;
    for (std::string line; std::getline(text, line);) {
        if (line.compare(0, tag.size(), tag) == 0)
            messages.push_back(line.substr(tag.size()));
    }
    return messages;
}

void ErrorLines::write(const char* text) {
    gathered += text;
    if (previous)
        previous->write(text);
}

}  // namespace pells_tool
