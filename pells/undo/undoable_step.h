#pragma once

#include <boost/smart_ptr/intrusive_ptr.hpp>
#include <string>
#include <vector>

#include "pells/core/smart_base.h"
#include "pells/serial/serializable.h"

namespace pells {

/// What an application passes through UndoRedoSequence::merge() to the steps that move, to give
/// them the identities of their new history. The library only hands it on.
class PELLS_API IdHandler {
public:
    virtual ~IdHandler();
};

/// One action of the user that can be taken back, saved and replayed.
///
/// The application derives its steps and registers a SerializableFactory for each class. A derived
/// class adds its own fields after getField("super"), so that "redoSuppressed" is saved inside the
/// element "super". Steps are held by intrusive pointers.
class PELLS_API UndoableStep : public Serializable, public smart_base {
public:
    ~UndoableStep() override;

    /// Reads the step's fields and then, if redoOnLoad() allows it, replays the action with redo(),
    /// whose result is ignored.
    void load(InTag& tag, boost::intrusive_ptr<Field> field) override;
    boost::intrusive_ptr<Field> getField(const std::string& name) override;

    /// Reverts the action; true when that worked.
    virtual bool undo() = 0;

    /// Applies the action again; true when that worked.
    virtual bool redo() = 0;

    /// Called when a history discards the step after it was undone, or drops it as invalid after
    /// loading, to release what redoing would need. Here nothing. The object itself lives on while
    /// it is referred to.
    virtual void destroy() const;

    /// False leaves the step out of saved histories and drops it from loaded ones. Here true.
    virtual bool isValid() const;

    /// The features of the model that the step concerns. Here none.
    virtual std::vector<int> getFeatureId() const;

    /// Called for each step that a history takes over from another one. Here nothing.
    virtual void updateId(const IdHandler& ids);

    /// Makes redoing the step, and replaying it on load, do nothing.
    virtual void suppressRedo(bool suppress);

    /// Whether loading the step replays it; here unless its redo is suppressed.
    virtual bool redoOnLoad() const;

    /// Whether suppressRedo() was called with true.
    bool redoSuppressed() const { return redoIsSuppressed; }

protected:
    UndoableStep() = default;
    UndoableStep(const UndoableStep&) = default;
    UndoableStep& operator=(const UndoableStep&) = default;

private:
    friend class UndoRedoSequence;

    bool redoIsSuppressed = false;
    // Set while load() runs, so that a history tells a step that was read in part from whole ones.
    bool incomplete = false;
};

}  // namespace pells
