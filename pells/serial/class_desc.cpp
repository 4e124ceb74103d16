#include "pells/serial/class_desc.h"

#include <algorithm>

namespace pells {

namespace {

bool nameLess(const boost::intrusive_ptr<Field>& field, const std::string& name) {
    return field->getName() < name;
}

}  // namespace

void ClassDescBase::add(boost::intrusive_ptr<Field> field) {
    if (!field)
        return;
    field->order = static_cast<std::int32_t>(fields.size());
    const Fields::iterator place =
        std::lower_bound(fields.begin(), fields.end(), field->getName(), nameLess);
    if (place != fields.end() && (*place)->getName() == field->getName())
        *place = std::move(field);
    else
        fields.insert(place, std::move(field));
}

boost::intrusive_ptr<Field> ClassDescBase::get(const std::string& name) const {
    const const_iterator place = std::lower_bound(fields.begin(), fields.end(), name, nameLess);
    if (place == fields.end() || (*place)->getName() != name)
        return nullptr;
    return *place;
}

}  // namespace pells
