#include "terminal.h"

#include <editline/readline.h>
#include <unistd.h>

#include <clocale>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <exception>
#include <memory>

#include "editor.h"

namespace material_editor {

namespace {

// libedit calls plain functions: what they need is left here.
const Editor* completingEditor = nullptr;
Words candidates;

struct Free {
    void operator()(char* text) const { std::free(text); }
};

bool beginsWith(const std::string& text, const char* start) {
    return text.compare(0, std::strlen(start), start) == 0;
}

/// Hands out the candidates that fit, one a call; libedit frees the copies.
char* nextCandidate(const char* start, int call) {
    static Words::size_type at;
    if (call == 0)
        at = 0;
    while (at < candidates.size()) {
        const std::string& candidate = candidates[at++];
        if (beginsWith(candidate, start))
            return strdup(candidate.c_str());
    }
    return nullptr;
}

/// Called for the Tab key: lists what the word could become.
char** complete(const char* start, int wordBegin, int /*wordEnd*/) {
    try {
        const std::string before(rl_line_buffer, static_cast<std::size_t>(wordBegin));
        const std::optional<Words> found = completingEditor->completions(splitWords(before));
        if (!found)
            return nullptr;  // libedit then completes names of files
        candidates = *found;
    } catch (const std::exception&) {
        candidates.clear();  // no exception may pass through libedit
    }
    rl_attempted_completion_over = 1;
    return rl_completion_matches(start, &nextCandidate);
}

}  // namespace

bool isInteractive() {
    return isatty(STDIN_FILENO) != 0 && isatty(STDOUT_FILENO) != 0;
}

Terminal::Terminal(const Editor& knowing) {
    // Only for the letters that can be typed. Numbers keep their decimal point.
    std::setlocale(LC_CTYPE, "");
    completingEditor = &knowing;
    rl_readline_name = "material_editor";
    rl_attempted_completion_function = &complete;
    using_history();
}

Terminal::~Terminal() {
    rl_attempted_completion_function = nullptr;
    completingEditor = nullptr;
}

std::optional<std::string> Terminal::readLine(const std::string& prompt) {
    const std::unique_ptr<char, Free> line(readline(prompt.c_str()));
    if (!line) {
        std::puts("");
        return std::nullopt;
    }
    if (*line != '\0')
        add_history(line.get());
    return line.get();
}

}  // namespace material_editor
