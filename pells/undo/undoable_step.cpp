#include "pells/undo/undoable_step.h"

#include <utility>

#include "pells/serial/member_field.h"

namespace pells {

IdHandler::~IdHandler() = default;

UndoableStep::~UndoableStep() = default;

void UndoableStep::load(InTag& tag, boost::intrusive_ptr<Field> field) {
    incomplete = true;
    Serializable::load(tag, field);
    incomplete = false;
    if (redoOnLoad())
        redo();
}

boost::intrusive_ptr<Field> UndoableStep::getField(const std::string& name) {
    ClassDesc desc(Serializable::getField("super"),
                   makeField("redoSuppressed", &UndoableStep::redoIsSuppressed));
    return makeComposite(name, std::move(desc));
}

void UndoableStep::destroy() const {}

bool UndoableStep::isValid() const {
    return true;
}

std::vector<int> UndoableStep::getFeatureId() const {
    return std::vector<int>();
}

void UndoableStep::updateId(const IdHandler& /*ids*/) {}

void UndoableStep::suppressRedo(bool suppress) {
    redoIsSuppressed = suppress;
}

bool UndoableStep::redoOnLoad() const {
    return !redoIsSuppressed;
}

}  // namespace pells
