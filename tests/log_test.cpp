#include "pells/log/log.h"

#include <boost/filesystem/operations.hpp>
#include <fstream>
#include <regex>

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
    return Log::instance().isEnabled(tag.c_str(), false);
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
