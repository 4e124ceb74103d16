#include "pells/serial/field.h"

namespace pells {

Field::Field(std::string_view fieldName) : name(fieldName) {}

Field::~Field() = default;

void Field::save(const Serializable* /*obj*/, OutTag& /*tag*/) {}

}  // namespace pells
