// Any rules and any tags: "RULES LF TAGS" as a preference and as the file of rules.

#include <cstdio>
#include <vector>

#include "fuzz/support/fuzz.h"
#include "pells/core/strings.h"
#include "pells/log/log.h"
#include "support/test_prefs.h"

namespace {

/// The verdict, found from the first rule to the last.
bool isOn(const std::vector<std::string>& rules, const std::string& tag) {
    bool on = tag == "*";
    for (const std::string& rule : rules) {
        const std::string pattern = rule.substr(rule[0] == '+' || rule[0] == '-');
        const bool fits = pattern == "*" || tag.substr(0, pattern.size()) == pattern;
        if (fits && !pattern.empty() && tag != "*")
            on = rule[0] != '-';
    }
    return on;
}

void tryTags(const std::vector<std::string>& rules, const std::vector<std::string>& tags) {
    for (const std::string& tag : tags) {
        pells::Log& log = pells::Log::instance();
        const bool wanted = isOn(rules, tag);
        pells_fuzz::require(log.isEnabled(tag, false) == wanted && log.registerTag(tag) == wanted &&
                                log.isEnabled(tag, true) == wanted,
                            "the last rule that fits decides");
    }
    pells::Log::instance().dumpTags();
}

}  // namespace

void fuzzOne(const std::string& input) {
    const std::size_t end = input.rfind('\n');
    if (end == std::string::npos)
        return;
    const std::string text = input.substr(0, end);
    std::vector<std::string> rules;
    std::vector<std::string> tags;
    pells::string_split(text, " \t\n", rules);
    pells::string_split(input.substr(end), "\n ", tags);

    std::remove("pells.log.prefs");
    pells_test::prefs() = {{"log", text}};
    tryTags(rules, tags);
    pells::SingletonList::freeSingletons();
    pells_test::prefs() = {};
    pells_fuzz::scratch().write("pells.log.prefs", text);
    tryTags(rules, tags);
}
