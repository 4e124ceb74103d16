#include "support/xml_samples.h"

#include <map>
#include <sstream>
#include <vector>

namespace pells_test {

namespace {

/// The alternatives of each symbol, which texts name behind a "$"; the first one leads to an end.
const std::map<char, const char*> rules = {
    {'D', "$E|$S$E$S|$S$C$S$E$C|$X$S$E$S|$X$C$E$S$C"},
    {'X',
     "<?xml$Wversion$Q$S?>|<?xml$Wversion$Q$Wencoding$Q$S?>|"
     "<?xml$Wversion$Q$Wstandalone$Q$S?>|<?xml$Wversion$Q$Wencoding$Q$Wstandalone$Q$S?>"},
    {'E', "<$N$A$S/>|<$N$A$S>$I</$N$S>|<$N$A$S>$I$I$I</$N$S>"},
    {'A', "|$W$N$Q|$W$N$Q$A"},
    {'I', "|$T|$W|$C$I|$X|$E|$T$E$T|\"$I|'$T"},
    {'Q', "=''|$S=$S\"$T\"|$S=$S'$T'|=\"'$T'\"|='\"$T\"'"},
    {'T', "|$c$c$c$T|$c$c$c$c$c$c$c$c$T|$c|$R$T|$H$T|$c$R$c$R"},
    {'R', "&amp;|&lt;|&gt;|&apos;|&quot;|&$N;|&#$9;|&#x$F;"},
    {'9', "0|$d$9|$d$d|$d$d$9"},
    {'F', "0|$d$F|$f$F|$f$f|$d$d$d"},
    {'N', "$a|$a$n|$a$n$n|xml|version"},
    {'n', "-|$a|$d|$a$d$n|$a$a$a$n|a-name-that-no-string-holds-inside"},
    {'C', "<!---->|<!--$m-->|<!--$m$m$m-->"},
    {'m', "|$k|- $m|-$k$m|$k$k$k$k$m|$k$k$k$k$k$k$k$k$k$k$k$k$k$k$k$k$m"},
    {'S', "||$W"},
    {'W', " |\t|\n|\r| $W|\n$W$W"},
    {'G', "$g|<t>$G$G|$g$G|$g$G$G|$g$g$g$G"},
    {'a', "a|b|c|X|Y|Z|_|-|x|m|l|t"},
    {'c', "e|t|a|o|i|n| |1|2|.|;|>|-|]|\n|\r|\t|\x01|:"},
    {'d', "0|1|2|3|4|5|6|7|8|9"},
    {'f', "a|F|c|D"},
    {'k', "a|b|c| |<|&|>|\n|\xE4"},
    {'H', "\x80|\xFF|\xC3\xA4|\xA0|\x85"},
    {'g',
     "<|>|</|/>|<a|</a>|<a>| |\n|a|b-1|=|\"|'|='v'|=\"v\"|&|&amp;|&#|&#x|41|fF|;|&no;|<!--|-|--|"
     "-->|->|x-y|<!-- c -->|<!|<?xml|<?|?>| version| encoding|xml| standalone|text|<a b='c' |"
     "<?xml version='1'|<?xml version='1'?>|\x01|\x80|9|]]>|:"},
};

std::map<char, std::vector<std::string>> splitRules() {
    std::map<char, std::vector<std::string>> split;
    for (const auto& rule : rules) {
        std::istringstream alternatives(rule.second);
        for (std::string each; std::getline(alternatives, each, '|');)
            split[rule.first].push_back(each);
    }
    return split;
}

}  // namespace

std::string XmlGenerator::text(char symbol, int depth) {
    static const std::map<char, std::vector<std::string>> split = splitRules();
    const std::vector<std::string>& alternatives = split.at(symbol);
    const std::string& chosen = alternatives[depth > 20 ? 0 : below(alternatives.size())];
    std::string made;
    for (std::size_t at = 0; at < chosen.size(); ++at)
        made += chosen[at] == '$' ? text(chosen[++at], depth + 1) : std::string(1, chosen[at]);
    return made;
}

std::string XmlGenerator::bytes() {
    std::string made = below(2) == 0 ? "<t>" : "";
    for (std::size_t left = below(40); left > 0; --left)
        made += static_cast<char>(static_cast<unsigned char>(random() >> 8));
    return made;
}

}  // namespace pells_test
