#include "pells/core/factory.h"
#include "pells/serial/member_field.h"
#include "pells/undo/undo_redo_sequence.h"
#include "support/documents.h"
#include "support/test_prefs.h"

using namespace pells;
using namespace pells_test;

namespace {

/// What the steps were asked to do, such as "undo a, redo a, ".
std::string journal;

std::string takeJournal() {
    return std::exchange(journal, "");
}

/// A step with a name of one letter; capital letters are invalid.
class Step : public UndoableStep {
public:
    Step() = default;
    explicit Step(char letter, UndoRedoSequence* ownHistory = nullptr)
        : name(1, letter), closed(ownHistory) {}
    ~Step() override {
        if (closed)
            note("end of");
    }

    bool undo() override { return act("undo"); }
    bool redo() override { return act("redo"); }
    void destroy() const override { note("destroy"); }
    bool isValid() const override { return name > "Z"; }
    void updateId(const IdHandler&) override { note("updateId"); }

    boost::intrusive_ptr<Field> getField(const std::string& fieldName) override {
        return makeComposite(
            fieldName, ClassDesc(UndoableStep::getField("super"), makeField("name", &Step::name)));
    }

    std::string name;
    bool works = true;

private:
    /// Makes its history let go of it, if it is given that, as one that closes a document might.
    bool act(const std::string& what) {
        if (closed)
            closed->clear();
        return note(what);
    }
    bool note(const std::string& what) const {
        journal += what + ' ' + name + ", ";
        return works;
    }

    UndoRedoSequence* closed = nullptr;
};

const SerializableFactory<Step> stepFactory("Step");

class StepWithItsOwnCount : public Step {
public:
    using Step::Step;

    void addRef() override { ++references; }
    void release() override {
        if (--references == 0)
            dispose();
    }

private:
    int references = 0;
};

/// Notes the steps it visits; says whether a step has, or has not, the name it looks for.
class Select : public UndoRedoSequence::BatchMethod {
public:
    explicit Select(std::string stepName, bool hit) : name(std::move(stepName)), said(hit) {}
    bool operator()(boost::intrusive_ptr<UndoableStep> step) const override {
        const std::string& found = static_cast<Step&>(*step).name;
        visited += found;
        return (found == name) == said;
    }
    std::string name;
    bool said;
    mutable std::string visited;
};

/// The names of the done steps and, behind a "|", of the undone ones.
std::string stateOf(const UndoRedoSequence& history) {
    const Select everything("", false);
    EXPECT_TRUE(history.applyToAll(everything, true));
    return everything.visited.insert(static_cast<std::size_t>(history.getUndoStackSize()), "|");
}

class UndoTest : public LibraryTest {
protected:
    /// Records steps, and takes back the last ones.
    void record(const std::string& names, int undone = 0) {
        for (const char name : names)
            history.addUndoable(new Step(name));
        for (; undone > 0; --undone)
            history.undo();
        journal.clear();
    }

    Step& last() const { return static_cast<Step&>(*history.getLast()); }

    UndoRedoSequence history;
};

TEST_F(UndoTest, GoesBackAndForthUntilAStepFails) {
    record("ab");
    Step& b = last();
    for (const char waiting : {'c', 'd'})
        history.addRedoable(new Step(waiting));
    EXPECT_TRUE(history.undo());
    EXPECT_EQ(stateOf(history), "a|bcd");
    EXPECT_TRUE(history.redo());
    b.works = false;
    EXPECT_FALSE(history.undo());
    EXPECT_EQ(stateOf(history), "ab|cd");
    b.works = true;
    EXPECT_TRUE(history.undo() && history.undo());
    EXPECT_FALSE(history.undo() || history.getLast());
    EXPECT_EQ(saved(history), "") << "nothing is done";
    // A step counts as done even when its redo is suppressed, or fails.
    history.redo();
    last().suppressRedo(true);
    b.works = false;
    EXPECT_FALSE(history.redo());
    EXPECT_EQ(stateOf(history), "ab|cd");
    b.works = true;
    EXPECT_TRUE(history.undo() && history.undo() && history.redo());
    EXPECT_EQ(takeJournal(),
              "undo b, redo b, undo b, undo b, undo a, redo a, redo b, undo b, undo a, ");
}

TEST_F(UndoTest, AStepOutlivesTheCallInWhichItsHistoryLetsGoOfIt) {
    history.addUndoable(new Step('a', &history));
    history.undo();
    history.addRedoable(new StepWithItsOwnCount('b', &history));
    history.redo();
    EXPECT_EQ(takeJournal(), "undo a, end of a, redo b, end of b, ");
    EXPECT_EQ(stateOf(history), "|");
}

TEST_F(UndoTest, RecordingDiscardsWhatWasUndone) {
    record("abc", 2);
    history.addUndoable(new Step('d'));
    EXPECT_EQ(takeJournal(), "destroy b, destroy c, ");
    EXPECT_EQ(stateOf(history), "ad|");
    history.clear();
    EXPECT_EQ(takeJournal(), "");
}

TEST_F(UndoTest, RemovesTheFirstStepSelected) {
    record("abac", 1);
    const std::pair<const char*, const char*> removals[] = {
        {"c", "aba|"}, {"a", "ba|"}, {"a", "b|"}, {"x", "b|"}};
    for (const auto& removal : removals) {
        EXPECT_EQ(history.removeIf(Select(removal.first, true)), *removal.first != 'x');
        EXPECT_EQ(stateOf(history), removal.second);
    }
    EXPECT_EQ(takeJournal(), "");
}

TEST_F(UndoTest, VisitsDoneStepsOrAllInEitherDirection) {
    record("abcd", 1);
    const Select to("", false), from("", false), toB("b", false), fromB("b", false);
    EXPECT_TRUE(history.applyToUndo(to, true));
    EXPECT_TRUE(history.applyToAll(from, false));
    EXPECT_FALSE(history.applyToAll(toB, true));
    EXPECT_FALSE(history.applyToUndo(fromB, false));
    EXPECT_EQ(to.visited + ' ' + from.visited + ' ' + toB.visited + ' ' + fromB.visited,
              "abc dcba ab cb");
}

TEST_F(UndoTest, MergingTakesOverTheDoneSteps) {
    record("abc", 1);
    UndoRedoSequence target;
    target.addUndoable(new Step('t'));
    target.addRedoable(new Step('u'));
    for (UndoRedoSequence* const other : {&history, &history, &target}) {
        target.merge(other, IdHandler());
        EXPECT_EQ(stateOf(target), "tab|");
        EXPECT_EQ(stateOf(history), "|");
    }
    EXPECT_EQ(takeJournal(), "destroy u, updateId a, updateId b, destroy c, ");
}

const std::string twoSteps =
    "<root><stack><stackItem class=\"Step\"><super><redoSuppressed>0</redoSuppressed></super>"
    "<name>a</name></stackItem>"
    "<stackItem class=\"Step\"><super><redoSuppressed>1</redoSuppressed></super>"
    "<name>b</name></stackItem></stack></root>";

TEST_F(UndoTest, SavesTheDoneAndValidStepsAndReplaysThemOnLoad) {
    record("aXb");
    last().suppressRedo(true);
    record("u", 1);
    EXPECT_EQ(compact(saved(history)), twoSteps);
    EXPECT_EQ(stateOf(history), "aXb|u");

    UndoRedoSequence copy;
    load(copy, twoSteps);
    EXPECT_EQ(takeJournal(), "redo a, ");
    EXPECT_EQ(compact(saved(copy)), twoSteps);
    EXPECT_EQ(failure(copy,
                      "<h><stack><stackItem class='Step'><name>X</name></stackItem>"
                      "<stackItem class='Step'><name>c</name></stackItem>"
                      "<stackItem class='Nobody'/></stack></h>"),
              "Bad class='Nobody' in element <stackItem>");
    EXPECT_EQ(takeJournal(), "redo X, redo c, destroy X, ");
    EXPECT_EQ(stateOf(copy), "abc|");
}

TEST_F(UndoTest, IsEmptyOnceLoadingHasDroppedEveryStep) {
    record("a");
    last().name = "A";
    load(history, "<h><stack/></h>");
    EXPECT_EQ(takeJournal(), "destroy A, ");
    EXPECT_EQ(stateOf(history), "|");
    EXPECT_FALSE(history.undo() || history.redo() || history.getLast());
    EXPECT_EQ(saved(history), "");
    record("b");
    EXPECT_EQ(stateOf(history), "b|");
}

TEST_F(UndoTest, KeepsWholeStepsOfADocumentCutAnywhere) {
    const std::string end = "</stackItem>";
    for (std::size_t cut = 7; cut < twoSteps.size() && !HasFailure(); ++cut) {
        SCOPED_TRACE(cut);
        const std::string text = twoSteps.substr(0, cut);
        UndoRedoSequence loaded;
        loaded.addUndoable(new Step('h'));
        EXPECT_NE(failure(loaded, text), "");
        const bool none = text.find(end) == std::string::npos;
        const bool both = text.find(end) != text.rfind(end);
        EXPECT_EQ(stateOf(loaded), none ? "h|" : both ? "hab|" : "ha|");
        EXPECT_TRUE(loaded.undo() && loaded.redo());
    }
}

TEST(Histories, ShareTheirStepsWithCopies) {
    const boost::intrusive_ptr<UndoableStep> step(new Step('s'));
    UndoRedoSequence history;
    history.addUndoable(step);
    UndoRedoSequence copy(history);
    EXPECT_EQ(copy.getLast(), step);
    EXPECT_EQ(step->getFeatureId(), std::vector<int>());
    EXPECT_TRUE(copy.undo());
    EXPECT_EQ(history.getUndoStackSize(), 1);
    history = copy;
    EXPECT_EQ(history.getRedoStackSize(), 1);
}

}  // namespace
