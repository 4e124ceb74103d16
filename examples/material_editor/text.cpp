#include "text.h"

#include <algorithm>
#include <charconv>
#include <cmath>
#include <stdexcept>
#include <system_error>

namespace material_editor {

namespace {

const char blanks[] = " \t\r";

bool isBlank(char c) {
    return c == ' ' || c == '\t' || c == '\r';
}

/// Reads the word that begins at a position, and moves the position behind it.
std::string readWord(const std::string& line, std::string::size_type& at) {
    std::string word;
    bool quoted = false;
    for (; at < line.size() && (quoted || !isBlank(line[at])); ++at) {
        if (line[at] == '"')
            quoted = !quoted;
        else
            word += line[at];
    }
    if (quoted)
        throw std::runtime_error("a quote is not closed");
    return word;
}

}  // namespace

Words splitWords(const std::string& line) {
    if (line.find('\0') != std::string::npos)
        throw std::runtime_error("the line holds a zero byte");
    Words words;
    std::string::size_type at = line.find_first_not_of(blanks);
    if (at != std::string::npos && line[at] == '#')
        return words;
    for (; at != std::string::npos; at = line.find_first_not_of(blanks, at))
        words.push_back(readWord(line, at));
    return words;
}

float parseNumber(const std::string& word) {
    float number = 0;
    const char* const end = word.data() + word.size();
    const std::from_chars_result result = std::from_chars(word.data(), end, number);
    // from_chars() knows "nan" and "inf", which no material can use.
    if (result.ec != std::errc() || result.ptr != end || !std::isfinite(number))
        throw std::runtime_error("'" + word + "' is not a number");
    return number;
}

std::string printable(std::string text) {
    const auto isControl = [](char c) { return (c >= 0 && c < ' ') || c == '\x7F'; };
    std::replace_if(text.begin(), text.end(), isControl, '?');
    return text;
}

std::string trimmed(const std::string& text) {
    const std::string::size_type first = text.find_first_not_of(blanks);
    if (first == std::string::npos)
        return std::string();
    return text.substr(first, text.find_last_not_of(blanks) - first + 1);
}

}  // namespace material_editor
