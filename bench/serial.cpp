// Saving a table of objects, some of them polymorphic, to XML and loading it, against other
// serialization libraries, and against a parser used by hand.

#include <memory>
#include <sstream>

#include "bench/serial/contestants.h"
#include "bench/support/bench.h"
#include "tests/support/allocations.h"

namespace {

template <class TableOf>
using Save = void (*)(TableOf& table, std::ostream& out);

template <class TableOf>
using Load = void (*)(TableOf& table, std::istream& in);

template <class TableOf>
TableOf filled(std::int64_t entries) {
    TableOf table;
    bench::fill(table, entries);
    return table;
}

template <class TableOf>
std::string saved(Save<TableOf> save, std::int64_t entries) {
    TableOf table = filled<TableOf>(entries);
    std::ostringstream out;
    save(table, out);
    return out.str();
}

/// Whether loading gives what was saved.
template <class TableOf>
bool isRight(Load<TableOf> load, std::istream& in, std::int64_t entries) {
    TableOf table;
    load(table, in);
    return bench::contents(table) == bench::contents(filled<TableOf>(entries));
}

void setAllocations(benchmark::State& state, const pells_test::AllocationMeter& meter,
                    std::int64_t entries) {
    state.counters["allocations_per_entry"] =
        static_cast<double>(meter.count()) / static_cast<double>(entries);
}

template <class TableOf>
void measureLoad(benchmark::State& state, Load<TableOf> load, const std::string& document,
                 std::int64_t entries) {
    std::istringstream in(document);
    if (!isRight(load, in, entries))
        state.SkipWithError("what is loaded differs from what was saved");
    std::unique_ptr<TableOf> table;
    const auto loadAgain = [&] { load(*table, in); };
    const auto prepare = [&] {
        table = std::make_unique<TableOf>();
        in.clear();
        in.seekg(0);
    };
    for (auto _ : state) {
        state.PauseTiming();
        prepare();
        state.ResumeTiming();
        loadAgain();
    }
    prepare();
    const pells_test::AllocationMeter meter;
    loadAgain();
    setAllocations(state, meter, entries);
}

template <class TableOf>
void measureSave(benchmark::State& state, Save<TableOf> save, Load<TableOf> load,
                 std::int64_t entries) {
    std::istringstream in(saved(save, entries));
    if (!isRight(load, in, entries))
        state.SkipWithError("what is loaded differs from what was saved");
    TableOf table = filled<TableOf>(entries);
    std::ostringstream out(in.str());  // so that it has its memory
    for (auto _ : state) {
        out.seekp(0);
        save(table, out);
    }
    const pells_test::AllocationMeter meter;
    out.seekp(0);
    save(table, out);
    setAllocations(state, meter, entries);
}

template <class TableOf>
void addLoad(std::int64_t entries, const std::string& contestant, Load<TableOf> load,
             const std::function<std::string()>& document) {
    bench::add("load", entries, contestant,
               [=](benchmark::State& state) { measureLoad(state, load, document(), entries); });
}

template <class TableOf>
void addLoad(std::int64_t entries, const std::string& contestant, Load<TableOf> load,
             Save<TableOf> save) {
    addLoad<TableOf>(entries, contestant, load, [=] { return saved(save, entries); });
}

template <class TableOf>
void addSave(std::int64_t entries, const std::string& contestant, Save<TableOf> save,
             Load<TableOf> load) {
    bench::add("save", entries, contestant,
               [=](benchmark::State& state) { measureSave(state, save, load, entries); });
}

}  // namespace

void addBenchmarks() {
    using namespace bench;
    for (const std::int64_t entries : sizes({1000, 100000})) {
        addLoad<Table>(entries, "pells", loadByPells, saveByPells);
        addLoad<PlainTable>(entries, "cereal", loadByCereal, saveByCereal);
        addLoad<PlainTable>(entries, "Boost", loadByBoost, saveByBoost);
        addLoad<PlainTable>(entries, "limit", loadByPugixml,
                            [=] { return saved(saveByPells, entries); });
        addSave<Table>(entries, "pells", saveByPells, loadByPells);
        addSave<PlainTable>(entries, "cereal", saveByCereal, loadByCereal);
        addSave<PlainTable>(entries, "Boost", saveByBoost, loadByBoost);
    }
}
