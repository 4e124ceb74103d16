#include <chrono>
#include <regex>

#include "pells/core/factory.h"
#include "pells/platform/counter.h"
#include "pells/timing/performance.h"
#include "pells/timing/timer.h"
#include "support/test_prefs.h"

using namespace pells;
using namespace pells_test;

namespace {

class TimestampTest : public LibraryTest {};
class ProbeTest : public LibraryTest {};

std::uint64_t microseconds(const Timestamp& time) {
    return std::uint64_t{time.getHigh()} << 32 | time.getLow();
}

TEST_F(TimestampTest, CarriesAndBorrowsBetweenItsHalves) {
    const std::uint32_t most = 0xFFFFFFFF;
    EXPECT_EQ(microseconds(Timestamp(0, most).addMicrosec(1)), 0x100000000u);
    EXPECT_EQ(microseconds(Timestamp(3, 5).addMicrosec(most)), 0x400000004u);
    EXPECT_EQ(microseconds(Timestamp(1, 0).subtractMicrosec(1)), most);
    EXPECT_EQ(microseconds(Timestamp(3, 5).subtractMicrosec(5)), 0x300000000u);
    EXPECT_EQ(microseconds(Timestamp().subtractMicrosec(1)), 0xFFFFFFFFFFFFFFFFu);
    EXPECT_TRUE(Timestamp(5, 10) < Timestamp(5, 11));
    EXPECT_TRUE(Timestamp(4, most) < Timestamp(5, 0));
}

TEST_F(TimestampTest, DiffersInMillisecondsAndMicrosecondsAsFarAsTheyReach) {
    const std::int32_t most = 2147483647;
    const std::int32_t least = -most - 1;
    const struct {
        Timestamp a, b;
        std::int32_t milliseconds, microseconds;
    } cases[] = {{Timestamp(0, 2500), Timestamp(0, 1000), 2, 1500},
                 {Timestamp(0, 1000), Timestamp(0, 2700), -1, -1700},
                 {Timestamp(0, 1000), Timestamp(0, 2499), 0, -1499},
                 {Timestamp(7, 5), Timestamp(6, 0xFFFFFFFF), 0, 6},
                 {Timestamp(6, 0xFFFFFFFF), Timestamp(7, 5), 0, -6},
                 {Timestamp(1000001, 123), Timestamp(2, 50), most, -50},
                 {Timestamp(2, 50), Timestamp(1000001, 123), least, 50},
                 // Too far apart:
                 {Timestamp(10, 0), Timestamp(5, 0), 21474836, 0},
                 {Timestamp(1000000, 123), Timestamp(0, 50), most, 73},
                 {Timestamp(3, 1), Timestamp(1000001, 0), least, 1}};
    for (const auto& each : cases) {
        EXPECT_EQ(each.a - each.b, each.milliseconds);
        EXPECT_EQ(each.a.diffInMicrosec(each.b), each.microseconds);
    }
    const std::string line = "diffInMicrosecond called with too much difference between arguments";
    EXPECT_EQ(logLines(), Lines(3, "error: " + line));
}

class StoppedClock : public Timer {
public:
    Timestamp now() override { return Timestamp(1, 2); }
};

TEST(Timer, IsMadeByTheApplicationsFactory) {
    EXPECT_THROW(Timer::instance(), Timer::NoImplementation);
    const Factory<Timer, StoppedClock> factory(Timer::TimerName);
    EXPECT_EQ(microseconds(Timer::instance().now()), 0x100000002u);
    SingletonList::freeSingletons();
    EXPECT_FALSE(Timer::singleton);
}

TEST(Counter, NeverGoesBackNorAheadOfTheClockOfTheSystem) {
    using namespace std::chrono;
    const steady_clock::time_point before = steady_clock::now();
    const std::uint64_t first = platform::counter();
    std::uint64_t last = first;
    while (last - first < 5000) {
        const std::uint64_t now = platform::counter();
        ASSERT_GE(now, last);
        last = now;
    }
    // The system's span holds the counter's, however slow the machine is.
    const steady_clock::duration span = steady_clock::now() - before;
    EXPECT_LE(last - first, duration_cast<std::chrono::microseconds>(span).count() + 2000u);
}

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
}

TEST_F(ProbeTest, LogsItsWholeTimeAndTheCategorysShare) {
    prefs() = {{"log", "time.detail"}};
    for (int time = 0; time < 2; ++time) {
        const Performance outer("outer", &PerformanceCategory::find("work"));
        const Performance inner("inner", &PerformanceCategory::find("rest"));
        const std::uint64_t end = platform::counter() + 2000;
        while (platform::counter() < end) {
        }
    }
    std::string lines;
    for (const std::string& line : logLines("time.detail."))
        lines += line + '\n';
    const std::regex wanted(
        "(work: Entering outer\nrest: Entering inner\n"
        "rest: Leaving  inner \\((\\d+) uS, \\2 uS in rest\\)\n"
        "work: Leaving  outer \\((\\d+) uS, (\\d+) uS in work\\)\n){2}");
    std::smatch spans;
    ASSERT_TRUE(std::regex_match(lines, spans, wanted)) << lines;
    EXPECT_GE(std::stoul(spans[2]), 2000u);
    EXPECT_LE(std::stoul(spans[4]) + 2000u, std::stoul(spans[3]));
}

TEST_F(ProbeTest, RegistersItsTagEveryTimeWithTheLogOfTheMoment) {
    PerformanceCategory& work = PerformanceCategory::find("work");
    for (const bool on : {true, false, true}) {
        prefs() = {{"log", on ? "time log.dumptags" : "log.dumptags"}};
        for (int i = 0; i < 4; ++i)
            const Performance probe("p", &work);
        Log::instance().isEnabled("time.detail.work", false);
        Log::instance().dumpTags();
        const std::string line = on ? "on    5  time.detail.work" : "off   5  time.detail.work";
        EXPECT_EQ(logLines("log.dumptags: " + line), Lines{""});
        EXPECT_EQ(logLines("time.detail.work: Entering p").size(), on ? 4u : 0u);
        SingletonList::freeSingletons();
    }
}

TEST_F(ProbeTest, KeepsItsVerdictAndItsLabelToTheEnd) {
    prefs() = {{"log", "time.detail.kept"}};
    {
        std::string label = "a label that is too long to be kept in place";
        const Performance kept(label, &PerformanceCategory::find("kept"));
        const Performance silent("silent", &PerformanceCategory::find("other"));
        label.assign(label.size(), '-');
        SingletonList::freeSingletons();
        prefs() = {{"log", "time.detail.other"}};
    }
    // The exit made a new log, which has the tag of no probe.
    const Lines lines = logLines();
    ASSERT_EQ(lines.size(), 1u);
    EXPECT_EQ(lines[0].find("time.detail.kept: Leaving  a label that is too long to be kept"), 0u);
}

TEST(Timer, NamesTheFactoryThatIsMissing) {
    try {
        pells::Timer::instance();
        FAIL() << "there is a timer";
    } catch (const pells::Timer::NoImplementation& missing) {
        EXPECT_NE(std::string(missing.what()).find("timerFactory(\"Timer\")"), std::string::npos);
    }
}

}  // namespace
