#include "pells/serial/composite_field.h"

#include <algorithm>
#include <utility>
#include <vector>

#include "pells/core/no_destructor.h"
#include "pells/log/log.h"
#include "pells/serial/detail/nesting.h"
#include "pells/xml/tag.h"

namespace pells {

namespace {

/// Orders fields by declaration. Two share an index after one was replaced by its name: the names
/// decide then, so that every run writes the same document.
bool fieldLess(const Field* a, const Field* b) {
    PELLS_LOG("mac", "FieldPtr less being called.");
    if (a->getOrder() != b->getOrder())
        return a->getOrder() < b->getOrder();
    return a->getName() < b->getName();
}

}  // namespace

CompositeField::CompositeField(std::string_view fieldName, ClassDesc&& classDesc)
    : Field(fieldName), desc(std::move(classDesc)) {}

CompositeField::CompositeField(std::string_view fieldName, const ClassDesc& classDesc)
    : Field(fieldName), desc(classDesc) {}

CompositeField::~CompositeField() = default;

void CompositeField::save(const Serializable* obj, OutTag& tag) {
    if (desc.empty()) {
        tag.writeSingleTag();
        return;
    }
    detail::checkNesting(tag);
    tag.writeOpenTag(true);
    std::vector<Field*, detail::PooledAllocator<Field*>> fields;
    fields.reserve(desc.size());
    for (const boost::intrusive_ptr<Field>& field : desc)
        fields.push_back(field.get());
    std::sort(fields.begin(), fields.end(), fieldLess);
    for (Field* const field : fields) {
        OutTag child(tag, field->getName());
        field->save(obj, child);
    }
    tag.writeCloseTag(true);
}

void CompositeField::load(Serializable* obj, InTag& tag) {
    tag.parseContents(obj, desc);
}

IgnoreField::IgnoreField() : Field("") {}

IgnoreField::~IgnoreField() = default;

void IgnoreField::save(const Serializable* /*obj*/, OutTag& /*tag*/) {}

void IgnoreField::load(Serializable* obj, InTag& tag) {
    tag.parseContents(obj, emptyDesc());
}

const ClassDesc& IgnoreField::emptyDesc() {
    static const NoDestructor<ClassDesc> desc;
    return *desc;
}

boost::intrusive_ptr<Field> makeComposite(std::string_view fieldName, ClassDesc desc) {
    if (desc.empty())
        return nullptr;
    return new CompositeField(fieldName, std::move(desc));
}

}  // namespace pells
