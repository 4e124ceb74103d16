#include "pells/serial/field.h"

namespace pells {

Field::Field(const std::string& fieldName) : name(fieldName) {}

Field::~Field() = default;

void Field::save(const Serializable* /*obj*/, OutTag& /*tag*/) {}

}  // namespace pells
