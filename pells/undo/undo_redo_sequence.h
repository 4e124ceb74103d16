#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <string>
#include <vector>

#include "pells/undo/undoable_step.h"

namespace pells {

/// The history of what the user did: steps that are done and, above them, steps that were undone.
///
/// Recording a new step discards the undone ones. Copies of a history share its steps; destroying a
/// history only lets go of them. Pointers passed in are not null. One thread only.
class PELLS_API UndoRedoSequence : public Serializable {
public:
    /// An operation of the caller's on one step.
    class PELLS_API BatchMethod {
    public:
        virtual ~BatchMethod();
        /// \param step not null. \return what the caller of the method asks of it.
        virtual bool operator()(boost::intrusive_ptr<UndoableStep> step) const = 0;
    };

    UndoRedoSequence();
    UndoRedoSequence(const UndoRedoSequence&);
    UndoRedoSequence& operator=(const UndoRedoSequence&);
    ~UndoRedoSequence() override;

    /// Records a step that has just been done; the redo stack is discarded.
    void addUndoable(boost::intrusive_ptr<UndoableStep> step);

    /// Records a step as undone, to be redone after all that wait already.
    void addRedoable(boost::intrusive_ptr<UndoableStep> step);

    /// Undoes the last step that is done. False when there is none, or when the step's undo()
    /// fails: then the step stays done.
    bool undo();

    /// Redoes the next undone step. False when there is none, or when the step's redo() fails; the
    /// step counts as done even so. A step whose redo is suppressed counts as done without a call.
    bool redo();

    /// The last step that is done, or null.
    boost::intrusive_ptr<UndoableStep> getLast() const;

    /// How many steps are done, and how many are undone.
    int getUndoStackSize() const { return current < 0 ? 0 : current + 1; }
    int getRedoStackSize() const { return static_cast<int>(steps.size()) - getUndoStackSize(); }

    /// Discards the undone steps after calling destroy() on each, the next to redo first.
    void clearRedoStack();

    /// Discards everything; only undone steps receive destroy().
    void clear();

    /// Discards this history's undone steps and appends the done steps of another one, after
    /// calling updateId(ids) on each. The other's undone steps receive destroy(); it is left empty.
    /// Merging a history with itself does nothing.
    void merge(UndoRedoSequence* other, const IdHandler& ids);

    /// Removes the first step that the method selects, without destroy(). \return whether one was.
    bool removeIf(const BatchMethod& method);

    /// Calls the method on the done steps, oldest first or (forward false) newest first, until it
    /// returns false. \return whether all calls returned true.
    bool applyToUndo(const BatchMethod& method, bool forward) const;

    /// The same for all steps.
    bool applyToAll(const BatchMethod& method, bool forward) const;

    /// Writes the steps that are done and valid. A history with nothing done writes nothing at all,
    /// not even its element.
    void save(OutTag& tag) override;

    /// Reads steps and appends them to those that the history holds; each one replays itself as it
    /// is read. Then invalid steps receive destroy() and are dropped, and all that are left count
    /// as done: those that were undone before the call, too, although they are not redone. Call
    /// clearRedoStack() first to avoid that.
    ///
    /// What fails in a step or in the document (Serializable::LoadFail) passes through; the history
    /// then holds what it held and the steps that were read in whole, with the same consequences.
    void load(InTag& tag, boost::intrusive_ptr<Field> field) override;
    boost::intrusive_ptr<Field> getField(const std::string& name) override;

private:
    typedef std::vector<boost::intrusive_ptr<UndoableStep>> Steps;

    const boost::intrusive_ptr<UndoableStep>& stepAt(int index) const {
        return steps[static_cast<Steps::size_type>(index)];
    }
    bool apply(const BatchMethod& method, int count, bool forward) const;
    void acceptLoadedSteps();

    Steps steps;
    int current;
};

inline bool UndoRedoSequence::undo() {
    if (current < 0)
        return false;
    UndoableStep& step = *stepAt(current);
    // The step may make the history let go of it.
    const KeptAlive kept(step);
    const bool undone = step.undo();
    if (undone)
        --current;
    return undone;
}

inline bool UndoRedoSequence::redo() {
    if (getRedoStackSize() == 0)
        return false;
    ++current;
    UndoableStep& step = *stepAt(current);
    const KeptAlive kept(step);
    return step.redoSuppressed() || step.redo();
}

}  // namespace pells
