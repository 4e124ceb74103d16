#include "pells/core/factory.h"
#include "pells/log/log.h"
#include "pells/timing/timer.h"
#include "pells/timing/timestamp.h"
#include "support/test_prefs.h"

namespace {

using pells::Timer;
using pells::Timestamp;

class TimestampTest : public pells_test::LibraryTest {};

void expectEqual(const Timestamp& a, const Timestamp& b) {
    EXPECT_EQ(a.getHigh(), b.getHigh());
    EXPECT_EQ(a.getLow(), b.getLow());
}

TEST_F(TimestampTest, CarriesAndBorrowsBetweenItsHalves) {
    expectEqual(Timestamp(0, 0xFFFFFFFF).addMicrosec(1), Timestamp(1, 0));
    expectEqual(Timestamp(1, 0).subtractMicrosec(1), Timestamp(0, 0xFFFFFFFF));
    expectEqual(Timestamp(3, 5).addMicrosec(0xFFFFFFFF), Timestamp(4, 4));
    expectEqual(Timestamp(3, 5).subtractMicrosec(0xFFFFFFFF), Timestamp(2, 6));
    expectEqual(Timestamp().subtractMicrosec(1), Timestamp(0xFFFFFFFF, 0xFFFFFFFF));
    EXPECT_TRUE(Timestamp(5, 10) < Timestamp(5, 11));
    EXPECT_TRUE(Timestamp(4, 0xFFFFFFFF) < Timestamp(5, 0));
    EXPECT_FALSE(Timestamp(5, 0) < Timestamp(5, 0));
}

struct Case {
    Timestamp a, b;
    std::int32_t difference;
};

TEST_F(TimestampTest, RoundsMillisecondsUpwardAndStaysInRange) {
    const Case cases[] = {{Timestamp(0, 2500), Timestamp(0, 1000), 2},
                          {Timestamp(0, 1000), Timestamp(0, 2700), -1},
                          {Timestamp(0, 1000), Timestamp(0, 2499), 0},
                          {Timestamp(1, 0), Timestamp(0, 0), 4294967},
                          {Timestamp(0, 0), Timestamp(1, 0), -4294966},
                          {Timestamp(1000000, 0), Timestamp(), 2147483647},
                          {Timestamp(), Timestamp(1000000, 0), -2147483647 - 1}};
    for (const auto& each : cases)
        EXPECT_EQ(each.a - each.b, each.difference);
}

TEST_F(TimestampTest, DiffersInMicrosecondsFromItsNeighboursAndReportsOthers) {
    const Case quiet[] = {{Timestamp(7, 5), Timestamp(6, 0xFFFFFFFF), 6},
                          {Timestamp(6, 0xFFFFFFFF), Timestamp(7, 5), -6},
                          {Timestamp(1000001, 123), Timestamp(2, 50), -50},
                          {Timestamp(0, 50), Timestamp(1000001, 123), 50},
                          {Timestamp(2, 50), Timestamp(1000001, 123), 50},
                          {Timestamp(0xFFFFFFFF, 1), Timestamp(0xFFFFFFFE, 3), -2}};
    for (const auto& each : quiet)
        EXPECT_EQ(each.a.diffInMicrosec(each.b), each.difference);
    EXPECT_FALSE(pells::Log::singleton);

    const std::string line =
        "error: diffInMicrosecond called with too much difference between arguments";
    EXPECT_EQ(Timestamp(10, 0).diffInMicrosec(Timestamp(5, 0)), 0);
    EXPECT_EQ(Timestamp(1000000, 123).diffInMicrosec(Timestamp(0, 50)), 73);
    EXPECT_EQ(Timestamp(3, 1).diffInMicrosec(Timestamp(1000001, 0)), 1);
    EXPECT_EQ(pells_test::logLines(), pells_test::Lines(3, line));
}

class StoppedClock : public Timer {
public:
    Timestamp now() override { return Timestamp(1, 2); }
};

TEST(Timer, IsMadeByTheApplicationsFactory) {
    for (int call = 0; call < 2; ++call)
        EXPECT_THROW(Timer::instance(), Timer::NoImplementation);
    EXPECT_EQ(pells::TimerFactory::create("Timer"), nullptr);
    const pells::Factory<Timer, StoppedClock> factory(Timer::TimerName);
    expectEqual(Timer::instance().now(), Timestamp(1, 2));
    pells::SingletonList::freeSingletons();
    EXPECT_FALSE(Timer::singleton);
}

}  // namespace
