#include "pells/serial/serializable.h"

#include "pells/core/class_name.h"
#include "pells/log/log.h"
#include "pells/xml/tag.h"

namespace pells {

Serializable::SaveFail::SaveFail(const std::string& message) : std::runtime_error(message) {
    PELLS_LOG("error", "SaveFail: " << message);
}

Serializable::SaveFail::~SaveFail() = default;

Serializable::LoadFail::LoadFail(const std::string& message) : std::runtime_error(message) {
    PELLS_LOG("error", "LoadFail: " << message);
}

Serializable::LoadFail::~LoadFail() = default;

void Serializable::save(OutTag& tag) {
    mustGetField(tag.getName(), "save")->save(this, tag);
}

void Serializable::load(InTag& tag, boost::intrusive_ptr<Field> field) {
    if (!field)
        field = mustGetField(tag.getName(), "load");
    field->load(this, tag);
}

boost::intrusive_ptr<Field> Serializable::getField(const std::string& /*name*/) {
    return nullptr;
}

Serializable::~Serializable() = default;

boost::intrusive_ptr<Field> Serializable::mustGetField(const std::string& name,
                                                       const char* method) {
    boost::intrusive_ptr<Field> field = getField(name);
    if (!field) {
        PELLS_LOG("error", className(typeid(*this)) << " must override either Serializable::"
                                                    << method << "() or Serializable::getField()!");
        throw LoadFail("No " + std::string(method) + "() method");
    }
    return field;
}

}  // namespace pells
