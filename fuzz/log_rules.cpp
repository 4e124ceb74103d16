// Any rules and any tags: "RULES LF TAGS" as a preference.

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

    pells_test::prefs() = {{"log", text}};
    pells::Log& log = pells::Log::instance();
    for (const std::string& tag : tags) {
        const bool wanted = isOn(rules, tag);
        pells_fuzz::require(log.isEnabled(tag, false) == wanted && log.registerTag(tag) == wanted,
                            "the last rule that fits decides");
    }
    log.dumpTags();
}
