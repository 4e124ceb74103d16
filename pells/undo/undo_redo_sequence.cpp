#include "pells/undo/undo_redo_sequence.h"

#include <algorithm>
#include <utility>

#include "pells/serial/member_field.h"

namespace pells {

namespace {

/// `current` of a history that holds no steps, and of one whose steps are all undone.
const int nothingHeld = -2;
const int allUndone = -1;

typedef std::vector<boost::intrusive_ptr<UndoableStep>> Steps;

/// Removes the steps that are not valid, asking them from the last to the first.
///
/// \param drop called with each of them. What it or a step throws passes through; the steps that
///             were not asked by then stay.
template <class Drop>
void removeInvalid(Steps& steps, Drop drop) {
    // The steps that stay move to the end, over a gap of those that do not.
    struct Gap {
        ~Gap() { steps.erase(first, last); }
        Steps& steps;
        Steps::iterator first;
        Steps::iterator last;
    } gap{steps, steps.end(), steps.end()};
    while (gap.first != steps.begin()) {
        boost::intrusive_ptr<UndoableStep>& step = *(gap.first - 1);
        if (!step->isValid())
            drop(*step);
        else if (gap.first == gap.last)
            --gap.last;
        else
            (--gap.last)->swap(step);
        --gap.first;
    }
}

}  // namespace

UndoRedoSequence::BatchMethod::~BatchMethod() = default;

UndoRedoSequence::UndoRedoSequence() : current(nothingHeld) {}
UndoRedoSequence::UndoRedoSequence(const UndoRedoSequence&) = default;
UndoRedoSequence& UndoRedoSequence::operator=(const UndoRedoSequence&) = default;
UndoRedoSequence::~UndoRedoSequence() = default;

void UndoRedoSequence::addUndoable(boost::intrusive_ptr<UndoableStep> step) {
    if (getRedoStackSize() > 0)
        clearRedoStack();
    steps.push_back(std::move(step));
    current = static_cast<int>(steps.size()) - 1;
}

void UndoRedoSequence::addRedoable(boost::intrusive_ptr<UndoableStep> step) {
    steps.push_back(std::move(step));
    current = std::max(current, allUndone);
}

boost::intrusive_ptr<UndoableStep> UndoRedoSequence::getLast() const {
    return current < 0 ? nullptr : stepAt(current);
}

void UndoRedoSequence::clearRedoStack() {
    const auto firstUndone = steps.begin() + getUndoStackSize();
    for (auto step = firstUndone; step != steps.end(); ++step)
        (*step)->destroy();
    steps.erase(firstUndone, steps.end());
}

void UndoRedoSequence::clear() {
    clearRedoStack();
    steps.clear();
    current = nothingHeld;
}

void UndoRedoSequence::merge(UndoRedoSequence* other, const IdHandler& ids) {
    if (other == this)
        return;
    clearRedoStack();
    for (int i = 0; i < other->getUndoStackSize(); ++i) {
        const boost::intrusive_ptr<UndoableStep>& step = other->stepAt(i);
        step->updateId(ids);
        steps.push_back(step);
    }
    current = static_cast<int>(steps.size()) - 1;
    other->clear();
}

bool UndoRedoSequence::removeIf(const BatchMethod& method) {
    const auto selected = std::find_if(
        steps.begin(), steps.end(),
        [&method](const boost::intrusive_ptr<UndoableStep>& step) { return method(step); });
    if (selected == steps.end())
        return false;
    if (current >= selected - steps.begin())
        --current;
    steps.erase(selected);
    return true;
}

bool UndoRedoSequence::applyToUndo(const BatchMethod& method, bool forward) const {
    return apply(method, getUndoStackSize(), forward);
}

bool UndoRedoSequence::applyToAll(const BatchMethod& method, bool forward) const {
    return apply(method, static_cast<int>(steps.size()), forward);
}

bool UndoRedoSequence::apply(const BatchMethod& method, int count, bool forward) const {
    for (int i = 0; i < count; ++i) {
        const int index = forward ? i : count - 1 - i;
        if (!method(stepAt(index)))
            return false;
    }
    return true;
}

void UndoRedoSequence::save(OutTag& tag) {
    if (current < 0)
        return;
    // The saved field is `steps` itself: it holds what is written while it is written.
    struct Restore {
        Steps& steps;
        Steps all;
        ~Restore() { steps.swap(all); }
    } restore{steps, steps};

    steps.resize(static_cast<Steps::size_type>(getUndoStackSize()));
    removeInvalid(steps, [](const UndoableStep& /*step*/) {});
    Serializable::save(tag);
}

void UndoRedoSequence::load(InTag& tag, boost::intrusive_ptr<Field> field) {
    try {
        Serializable::load(tag, field);
    } catch (...) {
        // Only the step that was being read can be missing or incomplete, and it is the last one.
        if (!steps.empty() && (!steps.back() || steps.back()->incomplete))
            steps.pop_back();
        acceptLoadedSteps();
        throw;
    }
    acceptLoadedSteps();
}

void UndoRedoSequence::acceptLoadedSteps() {
    removeInvalid(steps, [](const UndoableStep& step) { step.destroy(); });
    if (!steps.empty())
        current = static_cast<int>(steps.size()) - 1;
    else if (current > allUndone)
        current = nothingHeld;
}

boost::intrusive_ptr<Field> UndoRedoSequence::getField(const std::string& name) {
    ClassDesc desc(Serializable::getField("super"), makeField("stack", &UndoRedoSequence::steps));
    return makeComposite(name, std::move(desc));
}

}  // namespace pells
