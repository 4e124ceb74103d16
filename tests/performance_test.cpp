#include "pells/timing/performance.h"

#include <chrono>
#include <regex>
#include <thread>

#include "pells/core/factory.h"
#include "pells/platform/counter.h"
#include "support/test_prefs.h"

namespace {

using pells::Performance;
using pells::PerformanceCategory;

TEST(PerformanceCategories, ChargeOnlyTheInnermost) {
    PerformanceCategory& a = PerformanceCategory::find("a");
    PerformanceCategory& b = PerformanceCategory::find("b");
    EXPECT_EQ(PerformanceCategory::pop(5), 0u);

    // The clock wraps between the two pushes.
    EXPECT_EQ(PerformanceCategory::push(&a, 0xFFFFFFF0u), 0u);
    EXPECT_EQ(PerformanceCategory::push(&b, 0x10u), 0u);
    EXPECT_EQ(a.total(), 0x20u);
    EXPECT_EQ(PerformanceCategory::push(&b, 0x30u), 0x20u);
    EXPECT_EQ(PerformanceCategory::pop(0x31u), 0x21u);
    EXPECT_EQ(PerformanceCategory::pop(0x41u), 0x31u);
    EXPECT_EQ(PerformanceCategory::pop(0x51u), 0x30u);
    EXPECT_EQ(b.total(), 0x31u);
    EXPECT_EQ(a.stop(0x61u), 0x10u);
}

TEST(Counter, KeepsPaceWithTheSystemsClock) {
    using std::chrono::steady_clock;
    const auto microseconds = [](steady_clock::duration span) {
        return std::chrono::duration_cast<std::chrono::microseconds>(span).count();
    };
    const steady_clock::time_point begin = steady_clock::now();
    const std::uint64_t first = pells::platform::counter();
    const std::int64_t slack = 3000;
    std::uint64_t last = first;
    for (int i = 0; i < 100000; ++i) {
        // Bursts of readings with pauses of different lengths between them.
        if (i % 10000 == 0)
            std::this_thread::sleep_for(std::chrono::microseconds(300 * i / 10000));
        const std::int64_t least = microseconds(steady_clock::now() - begin);
        const std::uint64_t now = pells::platform::counter();
        const std::int64_t most = microseconds(steady_clock::now() - begin);
        ASSERT_GE(now, last);
        last = now;
        ASSERT_GE(static_cast<std::int64_t>(now - first), least - slack);
        ASSERT_LE(static_cast<std::int64_t>(now - first), most + slack);
    }
}

class ProbeTest : public pells_test::LibraryTest {};

void spend(std::uint64_t microseconds) {
    const std::uint64_t start = pells::platform::counter();
    while (pells::platform::counter() - start < microseconds) {
    }
}

TEST_F(ProbeTest, LogsItsWholeTimeAndTheCategorysShare) {
    pells_test::prefs() = {{"log", "time.detail log.dumptags"}};
    {
        const Performance outer("outer", &PerformanceCategory::find("work"));
        const Performance inner("inner", &PerformanceCategory::find("rest"));
        spend(2000);
    }
    pells::Log::instance().dumpTags();
    const pells_test::Lines lines = pells_test::logLines();
    ASSERT_GE(lines.size(), 4u);
    EXPECT_EQ(lines[0], "time.detail.work: Entering outer");
    EXPECT_EQ(lines[1], "time.detail.rest: Entering inner");
    const std::regex exit(
        "time\\.detail\\.(\\w+): Leaving  (\\w+) \\((\\d+) uS, (\\d+) uS in (\\w+)\\)");
    std::smatch inner, outer;
    ASSERT_TRUE(std::regex_match(lines[2], inner, exit)) << lines[2];
    ASSERT_TRUE(std::regex_match(lines[3], outer, exit)) << lines[3];
    EXPECT_EQ(inner.format("$1 $2 $5"), "rest inner rest");
    EXPECT_EQ(outer.format("$1 $2 $5"), "work outer work");
    EXPECT_GE(std::stoul(inner[3]), 2000u);
    EXPECT_LE(std::stoul(outer[4]) + 2000u, std::stoul(outer[3]));
}

TEST_F(ProbeTest, RegistersItsTagEveryTimeWithTheLogOfTheMoment) {
    PerformanceCategory& work = PerformanceCategory::find("work");
    for (const char* verdict : {"on ", "off", "on "}) {
        const bool on = verdict == std::string("on ");
        pells_test::prefs() = {{"log", on ? "time log.dumptags" : "log.dumptags"}};
        for (int i = 0; i < 4; ++i)
            const Performance probe("p", &work);
        pells::Log::instance().isEnabled("time.detail.work", false);
        pells::Log::instance().dumpTags();
        EXPECT_EQ(pells_test::logLines(std::string("log.dumptags: ") + verdict +
                                       "   5  time.detail.work"),
                  pells_test::Lines{""});
        EXPECT_EQ(pells_test::logLines("time.detail.work: Entering p").size(), on ? 4u : 0u);
        pells::SingletonList::freeSingletons();
    }
}

TEST_F(ProbeTest, KeepsItsVerdictAndItsLabelToTheEnd) {
    pells_test::prefs() = {{"log", "time.detail.kept"}};
    {
        std::string label = "a label that is too long to be kept in place";
        const Performance kept(label, &PerformanceCategory::find("kept"));
        const Performance silent("silent", &PerformanceCategory::find("other"));
        label.assign(label.size(), '-');
        pells::SingletonList::freeSingletons();
        pells_test::prefs() = {{"log", "time.detail.other"}};
    }
    // The exit made a new log, which has the tag of no probe.
    EXPECT_EQ(pells_test::logLines().size(), 1u);
    EXPECT_EQ(pells_test::logLines("time.detail.kept: Leaving  a label that is too long to be kept "
                                   "in place (")
                  .size(),
              1u);
}

TEST_F(ProbeTest, ChargesNothingWhenThereCanBeNoLog) {
    pells::FactoryByName::forget("Prefs");
    PerformanceCategory& work = PerformanceCategory::find("work");
    EXPECT_THROW(Performance("p", &work), pells::Prefs::NoImplementation);
    EXPECT_EQ(PerformanceCategory::pop(5), 0u);
}

}  // namespace
