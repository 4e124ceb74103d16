#pragma once

#include <ios>
#include <locale>
#include <sstream>
#include <string>
#include <type_traits>
#include <utility>

#include "pells/core/export.h"
#include "pells/xml/tag.h"

namespace pells::detail {

/// The types whose text form the library knows: numbers in the classic locale, and text as it is.
template <class T>
constexpr bool isNumber =
    std::is_same_v<T, bool> || std::is_same_v<T, float> || std::is_same_v<T, double> ||
    std::is_same_v<T, short> || std::is_same_v<T, unsigned short> || std::is_same_v<T, int> ||
    std::is_same_v<T, unsigned> || std::is_same_v<T, long> || std::is_same_v<T, unsigned long> ||
    std::is_same_v<T, long long> || std::is_same_v<T, unsigned long long>;

template <class T>
constexpr bool hasTextForm = isNumber<T> || std::is_same_v<T, std::string>;

/// A number as a stream of these settings writes it, whatever its locale.
PELLS_API std::string formatFloat(double value, const std::ios_base& settings);

/// A number as a fresh stream writes it: general notation with six digits.
PELLS_API std::string formatFloat(double value);

/// Scans a number at the start of a text, and checks that only white space follows it.
///
/// A text that does not start with a number, or with one out of range, leaves the value as it is.
/// \throws Serializable::LoadFail see InTag::checkEndText().
template <class T>
void scanNumber(const std::string& text, const InTag& tag, T& value);

extern template PELLS_API void scanNumber(const std::string&, const InTag&, bool&);
extern template PELLS_API void scanNumber(const std::string&, const InTag&, float&);
extern template PELLS_API void scanNumber(const std::string&, const InTag&, double&);
extern template PELLS_API void scanNumber(const std::string&, const InTag&, short&);
extern template PELLS_API void scanNumber(const std::string&, const InTag&, unsigned short&);
extern template PELLS_API void scanNumber(const std::string&, const InTag&, int&);
extern template PELLS_API void scanNumber(const std::string&, const InTag&, unsigned&);
extern template PELLS_API void scanNumber(const std::string&, const InTag&, long&);
extern template PELLS_API void scanNumber(const std::string&, const InTag&, unsigned long&);
extern template PELLS_API void scanNumber(const std::string&, const InTag&, long long&);
extern template PELLS_API void scanNumber(const std::string&, const InTag&, unsigned long long&);

/// Writes a value as the text of an element, whose start tag has been written.
template <class T>
void writeText(const T& value, OutTag& tag) {
    if constexpr (std::is_same_v<T, std::string>) {
        tag.writeText(value);
    } else if constexpr (std::is_floating_point_v<T> && isNumber<T>) {
        tag.writeText(formatFloat(static_cast<double>(value), tag.getStream()));
    } else if constexpr (isNumber<T>) {
        tag.writeText(std::to_string(value));
    } else {
        std::ostringstream text;
        text.imbue(std::locale::classic());
        text.flags(tag.getStream().flags());
        text.precision(tag.getStream().precision());
        text << value;
        tag.writeText(text.str());
    }
}

/// Reads a value from the current text of an element.
template <class T>
void readText(T& value, InTag& tag) {
    if constexpr (std::is_same_v<T, std::string>) {
        value = tag.getText();
    } else if constexpr (isNumber<T>) {
        scanNumber(tag.getText(), tag, value);
    } else {
        T scanned = value;
        if (tag.textStream() >> scanned)
            value = std::move(scanned);
        tag.checkEndText(tag.textStream());
    }
}

}  // namespace pells::detail
