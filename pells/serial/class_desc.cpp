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
    const std::string& name = field->getName();
    const auto place = std::lower_bound(fields.begin(), fields.end(), name, nameLess);
    if (place == fields.end())
        fields.push_back(std::move(field));
    else if ((*place)->getName() == name)
        *place = std::move(field);
    else
        fields.insert(place, std::move(field));
}

Field* ClassDescBase::find(const std::string& name) const {
    const auto hasName = [&name](const boost::intrusive_ptr<Field>& field) {
        return field->getName() == name;
    };
    // Most descriptions are short, and most names differ in length.
    const std::size_t shortList = 8;
    const const_iterator place =
        fields.size() <= shortList ? std::find_if(fields.begin(), fields.end(), hasName)
                                   : std::lower_bound(fields.begin(), fields.end(), name, nameLess);
    return place != fields.end() && hasName(*place) ? place->get() : nullptr;
}

}  // namespace pells
