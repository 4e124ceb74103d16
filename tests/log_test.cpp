#include "pells/log/log.h"

#include <boost/filesystem/operations.hpp>
#include <cfenv>
#include <cmath>
#include <cstdint>
#include <cstring>
#include <fstream>
#include <iomanip>
#include <limits>
#include <locale>
#include <random>
#include <regex>
#include <sstream>

#include "pells/core/factory.h"
#include "pells/platform/debugger.h"
#include "support/test_prefs.h"

using namespace pells;
using namespace pells_test;

namespace {

class LogTest : public LibraryTest {};

class Sink : public platform::DebuggerSink {
public:
    void write(const char* text) override { received += text; }
    std::string received;
};

bool isOn(const std::string& tag) {
    return Log::instance().isEnabled(tag, false);
}

TEST_F(LogTest, DecidesByTheLastPrefixThatFits) {
    const struct {
        const char* rules;
        Lines on, off;
    } cases[] = {{"+asset -asset.open", {"asset.list", "assetx"}, {"asset.open", "error"}},
                 {"-asset.open asset", {"asset.open"}, {"asse"}},
                 {"*\t-time", {"x", "", "*"}, {"time", "time.summary"}},
                 {"+ - ++x --y", {"+x"}, {"x", "-y", "y", "a"}},
                 {"a*", {"a*b"}, {"ab"}},
                 {"a\r\nb", {"b", "a\r"}, {"a"}}};
    for (const auto& each : cases) {
        SingletonList::freeSingletons();
        prefs() = {{"log", each.rules}};
        for (const std::string& tag : each.on)
            EXPECT_TRUE(isOn(tag)) << tag;
        for (const std::string& tag : each.off)
            EXPECT_FALSE(isOn(tag)) << tag;
    }
}

TEST_F(LogTest, RulesComeFromBothPreferencesOrElseFromTheFile) {
    prefs() = {{"logdefault", "*"}, {"log", "-error"}};
    // Longer than the pieces it is read in.
    scratch.write("pells.log.prefs", "error" + std::string(2000, ' ') + "late");
    EXPECT_FALSE(isOn("error"));
    EXPECT_TRUE(isOn("other"));
    SingletonList::freeSingletons();
    prefs().clear();
    EXPECT_TRUE(isOn("late"));
    EXPECT_FALSE(isOn("other"));
    SingletonList::freeSingletons();
    boost::filesystem::remove("pells.log.prefs");
    EXPECT_FALSE(Log::instance().isEnabled("error", true));
    EXPECT_TRUE(Log::instance().isEnabled("*", true)) << "the pseudo tag needs no rule";
}

TEST_F(LogTest, CannotBeMadeWithoutPreferences) {
    FactoryByName::forget("Prefs");
    EXPECT_THROW(Log::instance(), Prefs::NoImplementation);
    EXPECT_FALSE(Log::singleton);
    EXPECT_THROW(LogKey("error"), Prefs::NoImplementation);
    EXPECT_FALSE(Prefs::singleton);
}

TEST_F(LogTest, ListsItsTagsWithVerdictsAndUseCounts) {
    prefs() = {{"log", "* -off"}};
    Log& log = Log::instance();
    log.isEnabled("unseen", false);
    log.registerTag("off.one");
    log.registerTag("off.one");
    log.isEnabled("off.one", false);
    for (int i = 0; i < 1000; ++i)
        const LogKey key("app");
    log.isEnabled("*", true);
    log.dumpTags();
    EXPECT_EQ(logLines("log.dumptags: "),
              (Lines{"available log message tags:", "on  1000  app", "on    1  log.dumptags",
                     "on    1  log.flush", "off   3  off.one", "-- end of log tags --"}));
}

TEST_F(LogTest, DoesNotListItsTagsWhenThatTagIsOff) {
    prefs() = {{"log", "* -log"}};
    Log::instance().dumpTags();
    EXPECT_EQ(logLines(), Lines());
}

TEST_F(LogTest, BeginsWithADatedHeaderAndKeepsASitesVerdict) {
    prefs() = {{"log", "on"}};
    std::ofstream("pells.log") << "an earlier run\n";
    int evaluations = 0;
    for (int round = 0; round < 2; ++round) {
        PELLS_LOG("on", "round " << round);
        PELLS_LOG("off", ++evaluations);
        SingletonList::freeSingletons();
        prefs() = {{"log", "off"}};
    }
    EXPECT_EQ(evaluations, 0);
    const std::regex expected(
        "-{75}\nMirrik Pells - \\d{4} \\w+ \\d\\d at \\d\\d:\\d\\d:\\d\\d \\w* [+-]\\d{4}\n-{75}\n"
        "on: round 1\n");
    EXPECT_TRUE(std::regex_match(readFile("pells.log"), expected)) << readFile("pells.log");
}

TEST_F(LogTest, KeepsTextBackUntilItIsClosedAndThenAppends) {
    prefs() = {{"log", "* -log.flush"}};
    PELLS_LOG("app", "first");
    Log::instance().flush();
    EXPECT_EQ(readFile("pells.log"), "");
    Log::instance().close();
    PELLS_LOG("app", "second");
    EXPECT_EQ(logLines(), (Lines{"app: first", "app: second"}));
}

TEST_F(LogTest, IsOnDiskAfterEveryLineWhenToldToFlush) {
    prefs() = {{"log", "*"}};
    for (const std::string text : {"app: one\n", "app: two\n"}) {
        PELLS_LOG("app", text.substr(5, 3));
        const std::string file = readFile("pells.log");
        EXPECT_EQ(file.substr(file.size() - text.size()), text);
    }
}

/// Numbers whose text is easily got wrong, and random ones.
std::vector<double> numbers() {
    std::vector<double> all = {0, 0.1, 1.0 / 3, 0.5, 1e-300, 1e300, HUGE_VAL, std::nan("")};
    for (double power = 1e-6; power < 1e8; power *= 10) {
        for (const double each : {power, std::nextafter(power, 0), std::nextafter(power, 1e9),
                                  power * 0.9999995, power * 1.234565, power * 1.2345675})
            all.push_back(each);
    }
    // Exact middles between two texts: the even one is written.
    for (const double middle : {100000.5, 100001.5, 12345.25, 1234.5625, 2.015625e0, 999999.5})
        all.push_back(middle);
    std::mt19937_64 random(5);
    for (int i = 0; i < 20000; ++i) {
        const std::uint64_t bits = random();
        double anything;
        std::memcpy(&anything, &bits, sizeof anything);
        all.push_back(anything);
        all.push_back(std::ldexp(static_cast<double>(bits >> 11), static_cast<int>(i % 40) - 70));
        all.push_back(static_cast<double>(bits % 10000000) / 1000);
    }
    return all;
}

void writeNumbers(std::ostream& out) {
    for (const double each : numbers())
        out << each << ' ' << -each << ' ' << static_cast<float>(each) << '\n';
    const auto writeSome = [&out] {
        for (const double each : {0.0, -2.5, 1234.56123, 1e20})
            out << std::setw(9) << each << each << ' ' << std::setw(7) << -25 << 99u << '\n';
        out << true << ' ' << 2.5L << ' ' << static_cast<const void*>("") << ' ' << -1L << ' '
            << std::numeric_limits<long long>::min() << std::numeric_limits<std::uint64_t>::max()
            << '\n';
    };
    typedef std::ios_base Ios;
    for (const auto flag : {Ios::dec, Ios::fixed, Ios::scientific, Ios::hex, Ios::oct, Ios::showpos,
                            Ios::showpoint, Ios::uppercase, Ios::internal, Ios::boolalpha}) {
        const auto before = out.flags(flag);
        writeSome();
        out.flags(before);
    }
    for (const int precision : {0, 3, 17, 6}) {
        out << std::setprecision(precision) << std::setfill('*');
        writeSome();
    }
    std::fesetround(FE_UPWARD);
    writeSome();
    std::fesetround(FE_TONEAREST);
}

class Grouping : public std::numpunct<char> {
    char do_decimal_point() const override { return ','; }
    char do_thousands_sep() const override { return '.'; }
    std::string do_grouping() const override { return "\3"; }
};

TEST_F(LogTest, WritesNumbersAsAnyOtherStreamDoes) {
    const std::locale grouping(std::locale::classic(), new Grouping);
    for (const std::locale& global : {std::locale::classic(), grouping}) {
        const std::locale before = std::locale::global(global);
        std::ostringstream expected;
        writeNumbers(expected);
        writeNumbers(Log::instance().getStream());
        std::istringstream lines(expected.str());
        const std::vector<std::string> received = logLines();
        std::size_t at = 0;
        for (std::string line; std::getline(lines, line); ++at)
            ASSERT_EQ(received.at(at), line) << "line " << at << " of " << received.size();
        EXPECT_EQ(received.size(), at);
        pells::SingletonList::freeSingletons();
        std::locale::global(before);
    }
}

TEST_F(LogTest, ThatCannotOpenItsFileStillSpeaksToTheDebugger) {
    prefs() = {{"log", "app"}};
    Sink sink;
    platform::setDebuggerSink(&sink);
    boost::filesystem::create_directory("pells.log");
    PELLS_LOG("app", "first");
    Log::instance().close();
    // A later opening succeeds, but a file that failed once gets no more text.
    boost::filesystem::remove("pells.log");
    PELLS_LOG("app", "second");
    Log::instance().close();
    EXPECT_EQ(readFile("pells.log"), "");
    EXPECT_NE(sink.received.find("app: first\napp: second\n"), std::string::npos);
}

TEST_F(LogTest, SurvivesASinkThatDies) {
    Sink outer;
    platform::setDebuggerSink(&outer);
    {
        Sink inner;
        EXPECT_EQ(platform::setDebuggerSink(&inner), &outer);
    }
    PELLS_LOG("app", "to nobody");
    Log::instance().close();
    EXPECT_EQ(outer.received, "");
    EXPECT_EQ(platform::setDebuggerSink(nullptr), nullptr);
}

}  // namespace
