// Histories of the user's steps, against the one of a user interface library.

#include <QUndoStack>
#include <algorithm>
#include <vector>

#include "bench/support/bench.h"
#include "pells/undo/undo_redo_sequence.h"

namespace {

/// What every step changes.
std::int64_t model = 0;

class Step : public pells::UndoableStep {
public:
    bool undo() override {
        --model;
        return true;
    }
    bool redo() override {
        ++model;
        return true;
    }
};

class Command : public QUndoCommand {
public:
    void undo() override { --model; }
    void redo() override { ++model; }
};

class History {
public:
    /// Does a step and records it.
    void push() {
        Step* const step = new Step;
        step->redo();
        steps.addUndoable(step);
    }
    void undo() { steps.undo(); }
    void redo() { steps.redo(); }

private:
    pells::UndoRedoSequence steps;
};

class PeerHistory {
public:
    void push() { steps.push(new Command); }
    void undo() { steps.undo(); }
    void redo() { steps.redo(); }

private:
    QUndoStack steps;
};

template <class AnyHistory>
void push(AnyHistory& history, std::int64_t count) {
    for (std::int64_t i = 0; i < count; ++i)
        history.push();
}

void check(benchmark::State& state, bool everyStepTookPart) {
    if (!everyStepTookPart)
        state.SkipWithError("some steps were not called");
}

template <class AnyHistory>
void addPush(std::int64_t count, const std::string& contestant) {
    bench::add("history/push", count, contestant, [count](benchmark::State& state) {
        // Many short histories at a time, because stopping the clock takes time, too.
        const std::int64_t histories = std::max<std::int64_t>(10000 / count, 1);
        model = 0;
        for (auto _ : state) {
            state.PauseTiming();
            std::vector<AnyHistory> all(static_cast<std::size_t>(histories));
            state.ResumeTiming();
            for (AnyHistory& history : all)
                push(history, count);
            state.PauseTiming();
            check(state, model == count * histories);
            all = std::vector<AnyHistory>();
            model = 0;
            state.ResumeTiming();
        }
    });
}

template <class AnyHistory>
void addUndoAndRedo(std::int64_t count, const std::string& contestant) {
    bench::add("history/undo and redo", count, contestant, [count](benchmark::State& state) {
        AnyHistory history;
        push(history, count);
        for (auto _ : state) {
            model = count;
            for (std::int64_t i = 0; i < count; ++i)
                history.undo();
            check(state, model == 0);
            for (std::int64_t i = 0; i < count; ++i)
                history.redo();
            check(state, model == count);
        }
    });
}

}  // namespace

void addBenchmarks() {
    for (const std::int64_t count : bench::sizes({100, 10000, 1000000})) {
        addPush<History>(count, "pells");
        addPush<PeerHistory>(count, "QUndoStack");
        addUndoAndRedo<History>(count, "pells");
        addUndoAndRedo<PeerHistory>(count, "QUndoStack");
    }
}
