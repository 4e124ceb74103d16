#pragma once

#include <string>
#include <vector>

namespace material_editor {

typedef std::vector<std::string> Words;

/// The words of a command line: blanks separate them, double quotes hold blanks together. A line
/// that begins with "#" has none.
///
/// \throws std::runtime_error for a quote that is not closed, and for a zero byte, which would end
///         the name of a file early.
Words splitWords(const std::string& line);

/// A finite number, whatever the locale.
///
/// \throws std::runtime_error for anything else, such as "red", "1,5", "nan" or "1e99".
float parseNumber(const std::string& word);

/// A text from a stranger's file as a terminal can take it: control characters become "?".
std::string printable(std::string text);

/// The text without white space at both ends.
std::string trimmed(const std::string& text);

}  // namespace material_editor
