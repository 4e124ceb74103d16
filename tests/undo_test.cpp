#include <gtest/gtest.h>

#include <sstream>

#include "pells/serial/member_field.h"
#include "pells/undo/undo_redo_sequence.h"
#include "pells/xml/tag.h"
#include "support/test_prefs.h"

namespace {

using pells::IdHandler;
using pells::UndoRedoSequence;

/// What the steps were asked to do, such as "undo a".
std::vector<std::string> journal;

std::vector<std::string> takeJournal() {
    return std::exchange(journal, {});
}

typedef std::vector<std::string> Entries;

class Step : public pells::UndoableStep {
public:
    Step() = default;
    explicit Step(const std::string& stepName) : name(stepName) {}

    bool undo() override { return note("undo"); }
    bool redo() override { return note("redo"); }
    void destroy() const override { note("destroy"); }
    bool isValid() const override { return name.find("invalid") == std::string::npos; }
    void updateId(const IdHandler&) override { note("updateId"); }

    boost::intrusive_ptr<pells::Field> getField(const std::string& fieldName) override {
        return pells::makeComposite(fieldName,
                                    pells::ClassDesc(UndoableStep::getField("super"),
                                                     pells::makeField("name", &Step::name)));
    }

    std::string name;
    bool works = true;

protected:
    bool note(const std::string& what) const {
        journal.push_back(what + ' ' + name);
        return works;
    }
};

const pells::SerializableFactory<Step> stepFactory("Step");

typedef boost::intrusive_ptr<Step> StepPtr;

StepPtr record(UndoRedoSequence& history, const std::string& name) {
    StepPtr step(new Step(name));
    history.addUndoable(step);
    return step;
}

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

class Select : public UndoRedoSequence::BatchMethod {
public:
    explicit Select(std::string stepName) : name(std::move(stepName)) {}
    bool operator()(boost::intrusive_ptr<pells::UndoableStep> step) const override {
        visited.push_back(static_cast<Step&>(*step).name);
        return visited.back() == name;
    }
    std::string name;
    mutable Entries visited;
};

class Until : public Select {
public:
    using Select::Select;
    bool operator()(boost::intrusive_ptr<pells::UndoableStep> step) const override {
        return !Select::operator()(step);
    }
};

Entries namesOf(const UndoRedoSequence& history) {
    const Until everything("");
    EXPECT_TRUE(history.applyToAll(everything, true));
    return everything.visited;
}

void expectSizes(const UndoRedoSequence& history, int undoSize, int redoSize) {
    EXPECT_EQ(history.getUndoStackSize(), undoSize);
    EXPECT_EQ(history.getRedoStackSize(), redoSize);
}

std::string saved(UndoRedoSequence& history) {
    std::ostringstream out;
    pells::OutTag root(out, "history");
    history.save(root);
    return out.str();
}

void load(UndoRedoSequence& history, const std::string& document) {
    std::istringstream in(document);
    pells::XMLTokenizer tokenizer(in);
    pells::OpenTag root(tokenizer, tokenizer.getToken());
    history.load(root, nullptr);
}

class UndoTest : public pells_test::LibraryTest {
protected:
    UndoRedoSequence history;
    IdHandler ids;
};

TEST_F(UndoTest, AnEmptyHistoryDoesNothing) {
    expectSizes(history, 0, 0);
    EXPECT_FALSE(history.undo());
    EXPECT_FALSE(history.redo());
    EXPECT_FALSE(history.getLast());
    EXPECT_FALSE(history.removeIf(Until("")));
    EXPECT_TRUE(history.applyToUndo(Select("x"), true));
    EXPECT_EQ(saved(history), "");
    history.clearRedoStack();
    history.clear();
    expectSizes(history, 0, 0);
}

TEST_F(UndoTest, GoesBackAndForthUntilAStepFails) {
    const StepPtr a = record(history, "a");
    const StepPtr b = record(history, "b");
    EXPECT_TRUE(history.undo());
    EXPECT_EQ(history.getLast(), a);
    expectSizes(history, 1, 1);
    EXPECT_TRUE(history.redo());
    EXPECT_EQ(history.getLast(), b);
    b->works = false;
    EXPECT_FALSE(history.undo());
    expectSizes(history, 2, 0);
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
    expectSizes(history, 2, 0);
    EXPECT_EQ(takeJournal(), (Entries{"undo b", "redo b", "undo b", "undo b", "undo a", "redo a"}));
}

TEST_F(UndoTest, AStepOutlivesTheCallInWhichItsHistoryLetsGoOfIt) {
    history.addUndoable(new Closing(history));
    history.undo();
    EXPECT_EQ(takeJournal(), (Entries{"undo closing", "end of closing"}));
    history.addRedoable(new Closing(history));
    history.redo();
    EXPECT_EQ(takeJournal(), (Entries{"redo closing", "end of closing"}));
    history.addUndoable(new ClosingWithItsOwnCount(history));
    history.undo();
    EXPECT_EQ(takeJournal(), (Entries{"undo closing", "end of closing"}));
    expectSizes(history, 0, 0);
}

TEST_F(UndoTest, RecordingDiscardsWhatWasUndone) {
    for (const char* name : {"a", "b", "c"})
        record(history, name);
    history.undo();
    history.undo();
    takeJournal();
    record(history, "d");
    EXPECT_EQ(takeJournal(), (Entries{"destroy b", "destroy c"}));
    EXPECT_EQ(namesOf(history), (Entries{"a", "d"}));
    expectSizes(history, 2, 0);
    history.clear();
    EXPECT_EQ(takeJournal(), Entries());
    expectSizes(history, 0, 0);
}

TEST_F(UndoTest, RedoablesWaitBehindThoseThatWaitAlready) {
    history.addRedoable(new Step("a"));
    history.addRedoable(new Step("b"));
    expectSizes(history, 0, 2);
    EXPECT_EQ(saved(history), "");
    history.redo();
    history.redo();
    EXPECT_EQ(takeJournal(), (Entries{"redo a", "redo b"}));
}

TEST_F(UndoTest, RemovesTheFirstStepSelected) {
    for (const char* name : {"a", "b", "a", "c"})
        record(history, name);
    history.undo();
    takeJournal();
    EXPECT_TRUE(history.removeIf(Select("c")));  // undone
    expectSizes(history, 3, 0);
    EXPECT_TRUE(history.removeIf(Select("a")));  // the first of two
    expectSizes(history, 2, 0);
    EXPECT_EQ(namesOf(history), (Entries{"b", "a"}));
    EXPECT_TRUE(history.removeIf(Select("a")));  // the last one done
    EXPECT_FALSE(history.removeIf(Select("x")));
    expectSizes(history, 1, 0);
    EXPECT_EQ(takeJournal(), Entries());
}

TEST_F(UndoTest, VisitsDoneStepsOrAllInEitherDirection) {
    for (const char* name : {"a", "b", "c", "d"})
        record(history, name);
    history.undo();
    const struct {
        bool all, forward;
        const char* stop;
        Entries visited;
    } cases[] = {{false, true, "", {"a", "b", "c"}},
                 {false, false, "", {"c", "b", "a"}},
                 {false, false, "b", {"c", "b"}},
                 {true, true, "b", {"a", "b"}},
                 {true, false, "", {"d", "c", "b", "a"}}};
    for (const auto& each : cases) {
        const Until method(each.stop);
        const bool done = each.all ? history.applyToAll(method, each.forward)
                                   : history.applyToUndo(method, each.forward);
        EXPECT_EQ(done, *each.stop == '\0');
        EXPECT_EQ(method.visited, each.visited);
    }
}

TEST_F(UndoTest, MergingTakesOverTheDoneSteps) {
    UndoRedoSequence other;
    record(history, "t");
    record(history, "undone here");
    history.undo();
    for (const char* name : {"a", "b", "c"})
        record(other, name);
    other.undo();
    takeJournal();
    history.merge(&other, ids);
    EXPECT_EQ(takeJournal(),
              (Entries{"destroy undone here", "updateId a", "updateId b", "destroy c"}));
    EXPECT_EQ(namesOf(history), (Entries{"t", "a", "b"}));
    expectSizes(history, 3, 0);
    expectSizes(other, 0, 0);
    history.merge(&other, ids);
    history.merge(&history, ids);
    expectSizes(history, 3, 0);
    EXPECT_EQ(takeJournal(), Entries());
}

const char twoSteps[] =
    "<history>\n"
    "    <stack>\n"
    "        <stackItem class=\"Step\">\n"
    "            <super>\n"
    "                <redoSuppressed>0</redoSuppressed>\n"
    "            </super>\n"
    "            <name>a</name>\n"
    "        </stackItem>\n"
    "        <stackItem class=\"Step\">\n"
    "            <super>\n"
    "                <redoSuppressed>1</redoSuppressed>\n"
    "            </super>\n"
    "            <name>b</name>\n"
    "        </stackItem>\n"
    "    </stack>\n"
    "</history>\n";

TEST_F(UndoTest, SavesTheDoneAndValidStepsAndReplaysThemOnLoad) {
    record(history, "a");
    record(history, "invalid");
    record(history, "b")->suppressRedo(true);
    record(history, "undone");
    history.undo();
    EXPECT_EQ(saved(history), twoSteps);
    EXPECT_EQ(namesOf(history), (Entries{"a", "invalid", "b", "undone"}));
    expectSizes(history, 3, 1);

    takeJournal();
    UndoRedoSequence copy;
    load(copy, twoSteps);
    EXPECT_EQ(takeJournal(), Entries{"redo a"});
    EXPECT_EQ(saved(copy), twoSteps);
    load(copy, twoSteps);
    expectSizes(copy, 4, 0);
}

TEST_F(UndoTest, DropsInvalidStepsAfterLoading) {
    load(history,
         "<h><stack><stackItem class='Step'><name>a</name></stackItem>"
         "<stackItem class='Step'><name>invalid</name></stackItem>"
         "<stackItem class='Step'><name>b</name></stackItem></stack></h>");
    EXPECT_EQ(takeJournal(), (Entries{"redo a", "redo invalid", "redo b", "destroy invalid"}));
    expectSizes(history, 2, 0);
    UndoRedoSequence none;
    load(none, "<h><stack/></h>");
    expectSizes(none, 0, 0);
    record(none, "first");
    expectSizes(none, 1, 0);
}

TEST_F(UndoTest, KeepsWholeStepsOfADocumentCutAnywhere) {
    const std::string document = twoSteps;
    const std::string::size_type firstEnd = document.find("</stackItem>") + 12;
    const std::string::size_type secondEnd = document.rfind("</stackItem>") + 12;
    for (std::string::size_type cut = 10; cut < document.size() - 1; ++cut) {
        UndoRedoSequence loaded;
        record(loaded, "held");
        EXPECT_THROW(load(loaded, document.substr(0, cut)), pells::Serializable::LoadFail) << cut;
        expectSizes(loaded, 1 + (cut >= firstEnd) + (cut >= secondEnd), 0);
        takeJournal();
        EXPECT_TRUE(loaded.undo());
        EXPECT_TRUE(loaded.redo());
        if (HasFailure())
            FAIL() << "cut at " << cut;
    }
}

TEST_F(UndoTest, ReportsAStepOfAnUnknownClass) {
    try {
        load(history, "<h><stack><stackItem class='Nobody'/></stack></h>");
        FAIL() << "the document was accepted";
    } catch (const pells::Serializable::LoadFail& failure) {
        EXPECT_STREQ(failure.what(), "Bad class='Nobody' in element <stackItem>");
    }
    expectSizes(history, 0, 0);
}

}  // namespace
