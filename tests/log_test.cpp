#include "pells/log/log.h"

#include <boost/filesystem/operations.hpp>
#include <cfenv>
#include <cmath>
#include <cstdint>
#include <fstream>
#include <limits>
#include <locale>
#include <random>
#include <regex>
#include <sstream>

#include "pells/core/factory.h"
#include "pells/platform/debugger.h"
#include "support/debugger_text.h"
#include "support/test_prefs.h"
#include "support/thrown.h"

using namespace pells;
using namespace pells_test;

namespace {

class LogTest : public LibraryTest {};

struct Sink : platform::DebuggerSink {
    void write(const char* text) override { received += text; }
    std::string received;
};

bool isOn(const std::string& tag) {
    return Log::instance().isEnabled(tag, false);
}

TEST_F(LogTest, DecidesByTheLastPrefixThatFits) {
    scratch.write("pells.log.prefs", "asset");  // not read while there are preferences
    prefs() = {{"logdefault", "*\t-asset"},
               {"log", "+asset.open -b\r\n--x -++y -z* -time time - + "}};
    for (const std::string tag :
         {"asset.open", "asset.opened", "asse", "x", "y", "+z", "b", "zz", "time.x"})
        EXPECT_TRUE(isOn(tag)) << tag;
    for (const std::string tag : {"asset", "asset.list", "assets", "b\rx", "-x", "++y", "z*z"})
        EXPECT_FALSE(isOn(tag)) << tag;
}

TEST_F(LogTest, TakesItsRulesFromTheFileWithoutPreferences) {
    prefs().clear();
    // Longer than the pieces it is read in.
    scratch.write("pells.log.prefs", "error" + std::string(2000, ' ') + "late");
    EXPECT_TRUE(isOn("late"));
    EXPECT_FALSE(isOn("other"));
    SingletonList::freeSingletons();
    boost::filesystem::remove("pells.log.prefs");
    EXPECT_FALSE(isOn("late"));
    EXPECT_TRUE(isOn("*")) << "the pseudo tag needs no rule";
}

TEST_F(LogTest, CannotBeMadeWithoutPreferences) {
    FactoryByName::forget("Prefs");
    EXPECT_NE(thrown<Prefs::NoImplementation>([] {
                  Log::instance();
              }).find("pells::Factory<pells::Prefs"),
              std::string::npos);
    EXPECT_FALSE(Log::singleton);
    EXPECT_THROW(LogKey("error"), Prefs::NoImplementation);
    EXPECT_FALSE(Prefs::singleton);
}

TEST_F(LogTest, ListsItsTagsWithVerdictsAndUseCounts) {
    prefs() = {{"log", "* -off"}};
    Log& log = Log::instance();
    log.isEnabled("unseen", false);
    log.registerTag("off.one");
    const LogKey key("off.one");
    log.isEnabled("off.one", false);
    log.dumpTags();
    EXPECT_EQ(logLines("log.dumptags: "),
              (Lines{"available log message tags:", "on    1  log.dumptags", "on    1  log.flush",
                     "off   3  off.one", "-- end of log tags --"}));
}

TEST_F(LogTest, BeginsWithADatedHeaderAndFollowsASitesFirstVerdict) {
    prefs() = {{"log", "on"}};
    std::ofstream("pells.log") << "an earlier run\n";
    int evaluations = 0;
    for (int round = 0; round < 2; ++round) {
        PELLS_LOG("on", "round " << round);
        PELLS_LOG("off", ++evaluations);
        Log::instance().dumpTags();
        SingletonList::freeSingletons();
        prefs() = {{"log", "off"}};
    }
    EXPECT_EQ(evaluations, 0);
    const std::regex expected(
        "-{75}\nMirrik Pells - \\d{4} \\w+ \\d\\d at \\d\\d:\\d\\d:\\d\\d \\w* [+-]\\d{4}\n-{75}\n"
        "on: round 1\n");
    EXPECT_TRUE(std::regex_match(readFile("pells.log"), expected)) << readFile("pells.log");
}

TEST_F(LogTest, KeepsTextBackUntilItIsClosedUnlessToldToFlush) {
    prefs() = {{"log", "* -log.flush"}};
    PELLS_LOG("app", "first");
    Log::instance().flush();
    EXPECT_EQ(readFile("pells.log"), "");
    Log::instance().close();
    PELLS_LOG("app", "second");
    EXPECT_EQ(logLines(), (Lines{"app: first", "app: second"}));
    SingletonList::freeSingletons();
    prefs() = {{"log", "*"}};
    PELLS_LOG("app", "third");
    EXPECT_NE(readFile("pells.log").find("app: third\n"), std::string::npos);
}

/// Logs and gives a text, as a function that a message calls may do.
std::string nested(int depth) {
    if (depth > 0)
        PELLS_LOG("inner", "begin " << nested(depth - 1) << " end");
    return std::string(2000, static_cast<char>('a' + depth));
}

TEST_F(LogTest, KeepsAllTextWhereMessagesLogWhileTheyAreEvaluated) {
    for (const char* const rules : {"* -log.flush", "*"}) {
        prefs() = {{"log", rules}};
        PELLS_LOG("outer", "before " << nested(2) << " after");
        PELLS_LOG("app", "last");
        Log::instance().close();
        std::string text = readFile("pells.log");
        text.erase(0, text.find("outer: "));
        const auto filling = [](char letter) { return std::string(2000, letter); };
        EXPECT_EQ(text, "outer: before inner: begin inner: begin " + filling('a') + " end\n" +
                            filling('b') + " end\n" + filling('c') + " after\napp: last\n")
            << rules;
        SingletonList::freeSingletons();
    }
}

TEST_F(LogTest, GoesWhereItIsToldAndHearsAgainAfterAMessageThatFailed) {
    DebuggerText debugger;
    PELLS_LOG("app", static_cast<const char*>(nullptr) << "lost");
    PELLS_LOG("app", "heard");
    Log::instance().close();
    EXPECT_TRUE(debugger.has("app: heard\n"));
    for (const std::string name : {"", "other.log"}) {
        SingletonList::freeSingletons();
        boost::filesystem::remove("pells.log");
        Log::setFileName(name);
        PELLS_LOG("app", "elsewhere");
        Log::instance().close();
        EXPECT_EQ(files(), name.empty() ? Lines() : Lines{name});
    }
    EXPECT_NE(readFile("other.log").find("app: elsewhere\n"), std::string::npos);
    Log::setFileName("pells.log");
}

TEST_F(LogTest, ReadsRulesUpToALimitAndSaysSo) {
    prefs().clear();
    EXPECT_EQ(Log::maximumRulesSize(), std::size_t{1} << 20);
    Log::setMaximumRulesSize(20);
    scratch.write("pells.log.prefs", "error one\ttwo three-four-five");
    EXPECT_TRUE(isOn("two"));
    EXPECT_FALSE(isOn("three"));
    EXPECT_EQ(logLines(),
              Lines{"error: pells.log.prefs is longer than 20 bytes; the rest is ignored"});
    SingletonList::freeSingletons();
    scratch.write("pells.log.prefs", "error one twenty-one");
    EXPECT_TRUE(isOn("twenty-one"));
    EXPECT_EQ(logLines(), Lines());
}

/// Random numbers in random formats, many of them near the middle between two texts.
void writeNumbers(std::ostream& out) {
    typedef std::ios_base Ios;
    const Ios::fmtflags formats[] = {Ios::dec,       Ios::fixed,     Ios::scientific,
                                     Ios::hex,       Ios::oct,       Ios::showpos,
                                     Ios::showpoint, Ios::uppercase, Ios::internal};
    std::mt19937_64 random(5);
    for (unsigned i = 0; i < 30000; ++i) {
        const std::uint64_t bits = random();
        const double fraction = static_cast<double>(bits >> 11);
        const int power = static_cast<int>(i % 3000);
        out.flags(formats[i < 10000 ? 0 : i % std::size(formats)]);
        out.precision(i % 11 == 0 ? 3 : 6);
        std::fesetround(i % 13 == 0 ? FE_UPWARD : FE_TONEAREST);
        for (const double each :
             {std::ldexp(fraction, power - 1500), std::ldexp(fraction, power % 40 - 70),
              static_cast<double>(bits % 10000000) / 1000,
              100000.5 + static_cast<double>(bits % 900000),
              std::nextafter(std::pow(10, power % 14 - 6), 0)})
            out << std::setw(i % 7 == 0 ? 20 : 0) << each << ' ' << -each << ' ';
        out << static_cast<float>(fraction) << std::setw(i % 7 == 0 ? 20 : 0) << power - 1500 << ' '
            << bits << ' ' << static_cast<std::int64_t>(bits) << '\n';
        std::fesetround(FE_TONEAREST);
    }
}

TEST_F(LogTest, WritesNumbersAsAnyOtherStreamDoes) {
    std::ostringstream expected;
    writeNumbers(expected);
    writeNumbers(Log::instance().getStream());
    std::istringstream lines(expected.str());
    std::string line;
    for (const std::string& received : logLines())
        ASSERT_EQ(received, std::getline(lines, line) ? line : "nothing");
    EXPECT_FALSE(std::getline(lines, line)) << "missing: " << line;
}

TEST_F(LogTest, KeepsTheLocaleThatTheApplicationChose) {
    const std::locale chosen(std::locale::classic(), new std::numpunct<char>);
    const std::locale before = std::locale::global(chosen);
    EXPECT_TRUE(Log::instance().getStream().getloc() == chosen);
    std::locale::global(before);
}

TEST_F(LogTest, ThatCannotOpenItsFileStillSpeaksToTheDebuggerWhileItIsThere) {
    Sink outer;
    platform::setDebuggerSink(&outer);
    {
        Sink sink;
        EXPECT_EQ(platform::setDebuggerSink(&sink), &outer);
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
    PELLS_LOG("app", "to nobody");
    Log::instance().close();
    EXPECT_EQ(outer.received, "");
    EXPECT_EQ(platform::setDebuggerSink(nullptr), nullptr);
}

TEST_F(LogTest, WritesNumbersOfEveryWidth) {
    PELLS_LOG("app", 18446744073709551615ULL << ' ' << (-9223372036854775807LL - 1) << ' '
                                             << 4294967295UL << ' ' << -2147483647L);
    EXPECT_EQ(logLines("app: "),
              Lines{"18446744073709551615 -9223372036854775808 4294967295 -2147483647"});
}

TEST_F(LogTest, AppliesAWidthThatWasLeftBehindToTheNextTag) {
    pells::Log::instance().getStream().width(6);
    PELLS_LOG("app", "second");
    EXPECT_EQ(logLines("   app: "), Lines{"second"});
}

}  // namespace
