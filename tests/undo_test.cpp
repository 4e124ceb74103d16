#include "pells/serial/member_field.h"
#include "pells/undo/undo_redo_sequence.h"
#include "support/documents.h"
#include "support/test_prefs.h"

using namespace pells;
using namespace pells_test;

namespace {

/// What the steps were asked to do, such as "undo a".
Lines journal;

Lines takeJournal() {
    return std::exchange(journal, {});
}

class Step : public UndoableStep {
public:
    Step() = default;
    explicit Step(const std::string& stepName) : name(stepName) {}

    bool undo() override { return note("undo"); }
    bool redo() override { return note("redo"); }
    void destroy() const override { note("destroy"); }
    bool isValid() const override { return name.find("invalid") == std::string::npos; }
    void updateId(const IdHandler&) override { note("updateId"); }

    boost::intrusive_ptr<Field> getField(const std::string& fieldName) override {
        return makeComposite(
            fieldName, ClassDesc(UndoableStep::getField("super"), makeField("name", &Step::name)));
    }

    std::string name;
    bool works = true;

protected:
    bool note(const std::string& what) const {
        journal.push_back(what + ' ' + name);
        return works;
    }
};

const SerializableFactory<Step> stepFactory("Step");

typedef boost::intrusive_ptr<Step> StepPtr;

/// A step that makes its history let go of it, as one that closes a document might.
class Closing : public Step {
public:
    explicit Closing(UndoRedoSequence& ownHistory) : Step("closing"), history(ownHistory) {}
    ~Closing() override { note("end of"); }

    bool undo() override { return close("undo"); }
    bool redo() override { return close("redo"); }

private:
    bool close(const std::string& what) {
        history.clear();
        return note(what);
    }

    UndoRedoSequence& history;
};

class ClosingWithItsOwnCount : public Closing {
public:
    using Closing::Closing;

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
    explicit Select(std::string stepName, bool hit = true) : name(std::move(stepName)), said(hit) {}
    bool operator()(boost::intrusive_ptr<UndoableStep> step) const override {
        visited.push_back(static_cast<Step&>(*step).name);
        return (visited.back() == name) == said;
    }
    std::string name;
    bool said;
    mutable Lines visited;
};

/// The names of the done steps and, behind a "|", of the undone ones.
std::string stateOf(const UndoRedoSequence& history) {
    const Select everything("", false);
    EXPECT_TRUE(history.applyToAll(everything, true));
    std::string state;
    for (int i = 0; i <= history.getUndoStackSize() + history.getRedoStackSize(); ++i) {
        state += i == history.getUndoStackSize() ? "|" : "";
        if (i < static_cast<int>(everything.visited.size()))
            state += everything.visited[static_cast<std::size_t>(i)];
    }
    return state;
}

class UndoTest : public LibraryTest {
protected:
    StepPtr record(const std::string& name) {
        StepPtr step(new Step(name));
        history.addUndoable(step);
        return step;
    }

    /// Records steps with names of one letter, and takes back the last ones.
    void record(const std::string& letters, int undone) {
        for (const char letter : letters)
            record(std::string(1, letter));
        for (; undone > 0; --undone)
            history.undo();
        journal.clear();
    }

    UndoRedoSequence history;
};

TEST_F(UndoTest, AnEmptyHistoryDoesNothing) {
    EXPECT_FALSE(history.undo());
    EXPECT_FALSE(history.redo());
    EXPECT_FALSE(history.getLast());
    EXPECT_FALSE(history.removeIf(Select("", false)));
    EXPECT_TRUE(history.applyToUndo(Select("x"), true));
    EXPECT_EQ(saved(history), "");
    history.clearRedoStack();
    history.clear();
    EXPECT_EQ(stateOf(history), "|");
}

TEST_F(UndoTest, RedoablesWaitBehindThoseThatWaitAlready) {
    for (const char* name : {"a", "b"})
        history.addRedoable(new Step(name));
    EXPECT_EQ(stateOf(history), "|ab");
    EXPECT_EQ(saved(history), "");
    while (history.redo()) {
    }
    EXPECT_EQ(takeJournal(), (Lines{"redo a", "redo b"}));
}

TEST_F(UndoTest, GoesBackAndForthUntilAStepFails) {
    const StepPtr a = record("a");
    const StepPtr b = record("b");
    EXPECT_TRUE(history.undo());
    EXPECT_EQ(history.getLast(), a);
    EXPECT_EQ(stateOf(history), "a|b");
    EXPECT_TRUE(history.redo());
    EXPECT_EQ(history.getLast(), b);
    b->works = false;
    EXPECT_FALSE(history.undo());
    EXPECT_EQ(stateOf(history), "ab|");
    b->works = true;
    history.undo();
    history.undo();
    EXPECT_FALSE(history.undo());
    // A step counts as done even when its redo fails, or is suppressed.
    a->works = false;
    EXPECT_FALSE(history.redo());
    b->suppressRedo(true);
    EXPECT_TRUE(history.redo());
    EXPECT_FALSE(history.redo());
    EXPECT_EQ(stateOf(history), "ab|");
    EXPECT_EQ(takeJournal(), (Lines{"undo b", "redo b", "undo b", "undo b", "undo a", "redo a"}));
}

TEST_F(UndoTest, AStepOutlivesTheCallInWhichItsHistoryLetsGoOfIt) {
    history.addUndoable(new Closing(history));
    history.undo();
    EXPECT_EQ(takeJournal(), (Lines{"undo closing", "end of closing"}));
    history.addRedoable(new Closing(history));
    history.redo();
    EXPECT_EQ(takeJournal(), (Lines{"redo closing", "end of closing"}));
    history.addUndoable(new ClosingWithItsOwnCount(history));
    history.undo();
    EXPECT_EQ(takeJournal(), (Lines{"undo closing", "end of closing"}));
    EXPECT_EQ(stateOf(history), "|");
}

TEST_F(UndoTest, RecordingDiscardsWhatWasUndone) {
    record("abc", 2);
    record("d");
    EXPECT_EQ(takeJournal(), (Lines{"destroy b", "destroy c"}));
    EXPECT_EQ(stateOf(history), "ad|");
    history.clear();
    EXPECT_EQ(takeJournal(), Lines());
    EXPECT_EQ(stateOf(history), "|");
}

TEST_F(UndoTest, RemovesTheFirstStepSelected) {
    record("abac", 1);
    EXPECT_TRUE(history.removeIf(Select("c")));  // undone
    EXPECT_EQ(stateOf(history), "aba|");
    EXPECT_TRUE(history.removeIf(Select("a")));  // the first of two
    EXPECT_EQ(stateOf(history), "ba|");
    EXPECT_TRUE(history.removeIf(Select("a")));  // the last one done
    EXPECT_FALSE(history.removeIf(Select("x")));
    EXPECT_EQ(stateOf(history), "b|");
    EXPECT_EQ(takeJournal(), Lines());
}

TEST_F(UndoTest, VisitsDoneStepsOrAllInEitherDirection) {
    record("abcd", 1);
    const struct {
        bool all, forward;
        const char* stop;
        Lines visited;
    } cases[] = {{false, true, "", {"a", "b", "c"}},
                 {false, false, "", {"c", "b", "a"}},
                 {false, false, "b", {"c", "b"}},
                 {true, true, "b", {"a", "b"}},
                 {true, false, "", {"d", "c", "b", "a"}}};
    for (const auto& each : cases) {
        const Select method(each.stop, false);
        EXPECT_EQ(each.all ? history.applyToAll(method, each.forward)
                           : history.applyToUndo(method, each.forward),
                  *each.stop == '\0');
        EXPECT_EQ(method.visited, each.visited);
    }
}

TEST_F(UndoTest, MergingTakesOverTheDoneSteps) {
    record("abc", 1);
    UndoRedoSequence target;
    target.addUndoable(new Step("t"));
    target.addRedoable(new Step("undone"));
    const IdHandler ids;
    target.merge(&history, ids);
    EXPECT_EQ(takeJournal(), (Lines{"destroy undone", "updateId a", "updateId b", "destroy c"}));
    EXPECT_EQ(stateOf(target), "tab|");
    EXPECT_EQ(stateOf(history), "|");
    target.merge(&history, ids);
    target.merge(&target, ids);
    EXPECT_EQ(stateOf(target), "tab|");
    EXPECT_EQ(takeJournal(), Lines());
}

const char twoSteps[] =
    "<root><stack><stackItem class=\"Step\"><super><redoSuppressed>0</redoSuppressed></super>"
    "<name>a</name></stackItem>"
    "<stackItem class=\"Step\"><super><redoSuppressed>1</redoSuppressed></super>"
    "<name>b</name></stackItem></stack></root>";

TEST_F(UndoTest, SavesTheDoneAndValidStepsAndReplaysThemOnLoad) {
    for (const char* name : {"a", "invalid", "b", "undone"})
        record(name)->suppressRedo(*name == 'b');
    history.undo();
    EXPECT_EQ(compact(saved(history)), twoSteps);
    EXPECT_EQ(stateOf(history), "ainvalidb|undone");

    takeJournal();
    UndoRedoSequence copy;
    load(copy, twoSteps);
    EXPECT_EQ(takeJournal(), Lines{"redo a"});
    EXPECT_EQ(compact(saved(copy)), twoSteps);
    load(copy, twoSteps);
    EXPECT_EQ(stateOf(copy), "abab|");
}

TEST_F(UndoTest, DropsInvalidStepsAfterLoading) {
    load(history, "<h><stack/></h>");
    EXPECT_EQ(stateOf(history), "|");
    load(history,
         "<h><stack><stackItem class='Step'><name>a</name></stackItem>"
         "<stackItem class='Step'><name>invalid</name></stackItem>"
         "<stackItem class='Step'><name>b</name></stackItem></stack></h>");
    EXPECT_EQ(takeJournal(), (Lines{"redo a", "redo invalid", "redo b", "destroy invalid"}));
    EXPECT_EQ(stateOf(history), "ab|");
    EXPECT_EQ(failure(history, "<h><stack><stackItem class='Nobody'/></stack></h>"),
              "Bad class='Nobody' in element <stackItem>");
    EXPECT_EQ(stateOf(history), "ab|");
}

TEST_F(UndoTest, KeepsWholeStepsOfADocumentCutAnywhere) {
    const std::string document = twoSteps;
    const std::string::size_type firstEnd = document.find("</stackItem>") + 12;
    const std::string::size_type secondEnd = document.rfind("</stackItem>") + 12;
    for (std::string::size_type cut = 7; cut < document.size(); ++cut) {
        UndoRedoSequence loaded;
        loaded.addUndoable(new Step("held"));
        EXPECT_NE(failure(loaded, document.substr(0, cut)), "") << cut;
        EXPECT_EQ(stateOf(loaded), cut < firstEnd    ? "held|"
                                   : cut < secondEnd ? "helda|"
                                                     : "heldab|");
        EXPECT_TRUE(loaded.undo());
        EXPECT_TRUE(loaded.redo());
        if (HasFailure())
            FAIL() << "cut at " << cut;
    }
}

}  // namespace
