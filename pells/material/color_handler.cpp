#include "pells/material/color.h"
#include "pells/serial/composite_field.h"
#include "pells/serial/detail/text_form.h"
#include "pells/xml/tag.h"

namespace pells {

void SimpleTypeHandler<Color>::save(const Color& value, OutTag& tag) {
    tag.setAttr("r", detail::formatFloat(static_cast<double>(value.r)));
    tag.setAttr("g", detail::formatFloat(static_cast<double>(value.g)));
    tag.setAttr("b", detail::formatFloat(static_cast<double>(value.b)));
    tag.setAttr("a", detail::formatFloat(static_cast<double>(value.a)));
    tag.writeSingleTag();
}

void SimpleTypeHandler<Color>::load(Color& value, InTag& tag) {
    Color scanned = value;
    detail::scanNumber(tag.getAttr("r"), tag, scanned.r);
    detail::scanNumber(tag.getAttr("g"), tag, scanned.g);
    detail::scanNumber(tag.getAttr("b"), tag, scanned.b);
    detail::scanNumber(tag.getAttr("a"), tag, scanned.a);
    value = scanned;
    tag.parseContents(nullptr, IgnoreField::emptyDesc());
}

}  // namespace pells
