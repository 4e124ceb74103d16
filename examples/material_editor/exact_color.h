#pragma once

#include <pells/material/color.h>
#include <pells/serial/simple_type_handler.h>

#include <istream>
#include <limits>
#include <ostream>

namespace material_editor {

/// A colour whose form in XML is text, "1 0.5 0.25 1", with the digits of the document's stream.
///
/// The library's own form of a colour keeps to six digits. That is enough for a material that is
/// looked at, but a history has to replay to the last bit.
struct ExactColor {
    /// No number, so that a document without the colour is noticed.
    static constexpr float missing = std::numeric_limits<float>::quiet_NaN();

    pells::Color value{missing, missing, missing, missing};
};

inline std::ostream& operator<<(std::ostream& out, const ExactColor& color) {
    const pells::Color& c = color.value;
    return out << c.r << ' ' << c.g << ' ' << c.b << ' ' << c.a;
}

inline std::istream& operator>>(std::istream& in, ExactColor& color) {
    pells::Color& c = color.value;
    return in >> c.r >> c.g >> c.b >> c.a;
}

}  // namespace material_editor

/// Makes the type persistent: a value type of the application's that has operators << and >> needs
/// no more than this.
template <>
class pells::SimpleTypeHandler<material_editor::ExactColor>
    : public pells::TextTypeHandler<material_editor::ExactColor> {};
