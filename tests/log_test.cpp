#include "pells/log/log.h"

#include <gtest/gtest.h>

#include <boost/filesystem/operations.hpp>
#include <regex>

#include "pells/core/factory.h"
#include "pells/platform/debugger.h"
#include "support/test_prefs.h"

namespace {

using pells::Log;
using pells_test::logLines;
using pells_test::prefs;
using pells_test::readFile;

class LogTest : public pells_test::LibraryTest {};

class Sink : public pells::platform::DebuggerSink {
public:
    void write(const char* text) override { received += text; }
    std::string received;
};

struct RuleCase {
    const char* name;
    const char* rules;
    std::vector<const char*> on;
    std::vector<const char*> off;
};

class LogRules : public LogTest, public ::testing::WithParamInterface<RuleCase> {};

TEST_P(LogRules, DecideByTheLastPrefixThatFits) {
    prefs() = {{"log", GetParam().rules}};
    for (const char* tag : GetParam().on)
        EXPECT_TRUE(Log::instance().isEnabled(tag, false)) << tag;
    for (const char* tag : GetParam().off)
        EXPECT_FALSE(Log::instance().isEnabled(tag, false)) << tag;
}

INSTANTIATE_TEST_SUITE_P(
    Log, LogRules,
    ::testing::Values(RuleCase{"Exception",
                               "+asset -asset.open",
                               {"asset.list", "assetx"},
                               {"asset.open", "error"}},
                      RuleCase{"LaterWins", "-asset.open asset", {"asset.open"}, {"asse"}},
                      RuleCase{"AllBut", "*\t-time", {"x", "", "*"}, {"time", "time.summary"}},
                      RuleCase{"LoneSigns", "+ - ++x --y", {"+x"}, {"x", "-y", "y", "a"}},
                      RuleCase{"StarInsideIsPlain", "a*", {"a*b"}, {"ab"}},
                      RuleCase{"CarriageReturnIsNoSeparator", "a\r\nb", {"b", "a\r"}, {"a"}},
                      RuleCase{"LongerThanTheTag", "asset.open", {"asset.open"}, {"asset"}}),
    [](const auto& each) { return std::string(each.param.name); });

TEST_F(LogTest, RulesOfBothPreferencesCountAndTheFileDoesNot) {
    prefs() = {{"logdefault", "*"}, {"log", "-error"}};
    scratch.write("pells.log.prefs", "error");
    EXPECT_FALSE(Log::instance().isEnabled("error", false));
    EXPECT_TRUE(Log::instance().isEnabled("other", false));
}

TEST_F(LogTest, RulesComeFromTheFileWhenBothPreferencesAreEmpty) {
    prefs().clear();
    // Longer than the pieces it is read in.
    scratch.write("pells.log.prefs", std::string(2000, ' ') + "late");
    EXPECT_TRUE(Log::instance().isEnabled("late", false));
    EXPECT_FALSE(Log::instance().isEnabled("error", false));
}

TEST_F(LogTest, WithoutAnyRuleOnlyThePseudoTagIsOn) {
    prefs().clear();
    EXPECT_FALSE(Log::instance().isEnabled("error", true));
    EXPECT_TRUE(Log::instance().isEnabled("*", true));
}

TEST_F(LogTest, CannotBeMadeWithoutPreferences) {
    pells::FactoryByName::forget("Prefs");
    EXPECT_THROW(Log::instance(), pells::Prefs::NoImplementation);
    EXPECT_FALSE(Log::singleton);
    EXPECT_THROW(pells::LogKey("error"), pells::Prefs::NoImplementation);
}

TEST_F(LogTest, ListsItsTagsWithVerdictsAndUseCounts) {
    prefs() = {{"log", "* -off"}};
    Log& log = Log::instance();
    log.isEnabled("unseen", false);
    log.registerTag("off.one");
    log.registerTag("off.one");
    log.isEnabled("off.one", false);
    for (int i = 0; i < 1000; ++i)
        const pells::LogKey key("app");
    log.isEnabled("*", true);
    log.dumpTags();
    EXPECT_EQ(logLines(),
              (std::vector<std::string>{
                  "log.dumptags: available log message tags:", "log.dumptags: on  1000  app",
                  "log.dumptags: on    1  log.dumptags", "log.dumptags: on    1  log.flush",
                  "log.dumptags: off   3  off.one", "log.dumptags: -- end of log tags --"}));
}

TEST_F(LogTest, DoesNotListItsTagsWhenThatTagIsOff) {
    prefs() = {{"log", "* -log"}};
    Log::instance().dumpTags();
    EXPECT_TRUE(logLines().empty());
}

TEST_F(LogTest, BeginsWithADatedHeaderAndKeepsASitesVerdict) {
    prefs() = {{"log", "on"}};
    std::ofstream("pells.log") << "an earlier run\n";
    int evaluations = 0;
    for (int round = 0; round < 2; ++round) {
        PELLS_LOG("on", "round " << round);
        PELLS_LOG("off", ++evaluations);
        pells::SingletonList::freeSingletons();
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
    EXPECT_EQ(logLines(), (std::vector<std::string>{"app: first", "app: second"}));
}

TEST_F(LogTest, IsOnDiskAfterEveryLineWhenToldToFlush) {
    prefs() = {{"log", "*"}};
    for (const char* text : {"one", "two"}) {
        PELLS_LOG("app", text);
        EXPECT_NE(readFile("pells.log").find(std::string("app: ") + text + "\n"),
                  std::string::npos);
    }
    EXPECT_EQ(logLines().size(), 2u);
}

TEST_F(LogTest, ThatCannotOpenItsFileStillSpeaksToTheDebugger) {
    prefs() = {{"log", "app"}};
    Sink sink;
    pells::platform::setDebuggerSink(&sink);
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
    pells::platform::setDebuggerSink(&outer);
    {
        Sink inner;
        EXPECT_EQ(pells::platform::setDebuggerSink(&inner), &outer);
    }
    PELLS_LOG("app", "to nobody");
    Log::instance().close();
    EXPECT_EQ(outer.received, "");
    EXPECT_EQ(pells::platform::setDebuggerSink(nullptr), nullptr);
}

}  // namespace
