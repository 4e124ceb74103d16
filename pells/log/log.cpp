#include "pells/log/log.h"

#include <algorithm>
#include <ctime>
#include <iomanip>
#include <sstream>

#include "pells/core/no_destructor.h"
#include "pells/core/prefs.h"
#include "pells/log/detail/exit_hooks.h"
#include "pells/log/detail/log_file.h"
#include "pells/log/detail/number_format.h"

namespace pells {

template class RogueSingleton<Log, SingletonFactory<Log>>;
template class Singleton<Log, SingletonFactory<Log>>;

namespace {

/// Ends the log when the library is unloaded; a log that is gone by then is not made again.
class LogExitHook {
public:
    LogExitHook() = default;
    LogExitHook(const LogExitHook&) = delete;
    LogExitHook& operator=(const LogExitHook&) = delete;
    ~LogExitHook() {
        if (!Log::singleton)
            return;
        try {
            Log::singleton->dumpTags();
            Log::singleton->close();
        } catch (...) {
            // There is nobody left to tell.
        }
    }
};

/// Both hooks, in the order of construction whose reverse is the order of the farewell: the time
/// summary is written before the log lists its tags and closes.
[[maybe_unused]] const bool exitHooksInstalled = [] {
    static LogExitHook logExitHook;
    detail::installTimeSummaryHook();
    return true;
}();

std::uint64_t logsMade = 0;

const char prefsFileName[] = "pells.log.prefs";
const char separators[] = " \t\n";

std::size_t rulesLimit = std::size_t{1024} * 1024;

std::string& fileName() {
    static NoDestructor<std::string> name("pells.log");
    return *name;
}

/// Reads the rules' file as far as the limit allows.
///
/// \param cut set when it goes on behind the limit; the last word, which may go on as well, is left
///            out then.
std::string readPrefsFile(bool& cut) {
    std::string text;
    detail::RegularFile file;
    if (!file.openToRead(prefsFileName))
        return text;
    char piece[4096];
    std::ptrdiff_t got = 0;
    while (text.size() <= rulesLimit && (got = file.readAt(text.size(), piece, sizeof piece)) > 0)
        text.append(piece, static_cast<std::size_t>(got));
    cut = text.size() > rulesLimit;
    if (cut) {
        text.resize(rulesLimit);
        text.resize(text.find_last_of(separators) + 1);
    }
    return text;
}

std::string localTime() {
    const std::time_t now = std::time(nullptr);
    const std::tm* const local = std::localtime(&now);
    char text[100] = "";
    if (local)
        std::strftime(text, sizeof text, "%Y %B %d at %I:%M:%S %p %z", local);
    return text;
}

}  // namespace

const std::string& Log::getFileName() {
    return fileName();
}

void Log::setFileName(const std::string& path) {
    fileName() = path;
}

std::size_t Log::maximumRulesSize() {
    return rulesLimit;
}

void Log::setMaximumRulesSize(std::size_t bytes) {
    rulesLimit = bytes;
}

Log::Log()
    : rulesWereCut(false),
      logFile(std::make_unique<detail::LogFile>(fileName())),
      flushEach(false),
      teeStream(debugStream, *logFile),
      serialNumber(++logsMade) {
    // An application that has chosen another locale for its streams finds its forms in the log.
    if (teeStream.getloc() == std::locale::classic())
        teeStream.imbue(detail::fastClassicLocale());
    readRules();
    writeHeader();
    flushEach = isEnabled("log.flush", true);
    flush();
}

Log::~Log() = default;

void Log::readRules() {
    std::string text = Prefs::instance().getString("logdefault");
    text += ' ';
    text += Prefs::instance().getString("log");
    if (text == " ")
        text += readPrefsFile(rulesWereCut);

    // One by one, as a list of all words would take many times the memory of the text.
    std::string::size_type begin = text.find_first_not_of(separators);
    while (begin != std::string::npos) {
        const std::string::size_type end =
            std::min(text.find_first_of(separators, begin), text.size());
        addRule(text.substr(begin, end - begin));
        begin = text.find_first_not_of(separators, end);
    }
}

void Log::addRule(const std::string& word) {
    const bool enabled = word[0] != '-';
    const bool hasSign = word[0] == '+' || word[0] == '-';
    const std::string pattern = word.substr(hasSign ? 1 : 0);
    if (!pattern.empty())
        rules.emplace_back(enabled, pattern);
}

void Log::writeHeader() {
    const std::string line(75, '-');
    std::ostream& stream = getStream();
    stream << line << "\nMirrik Pells - " << localTime() << '\n' << line << '\n';
    if (rulesWereCut && isEnabled("error", false))
        stream << "error: " << prefsFileName << " is longer than " << rulesLimit
               << " bytes; the rest is ignored\n";
}

bool Log::isEnabled(const std::string& tag, bool remember) {
    if (tag == "*")
        return true;
    const auto known = tagTable.find(tag);
    if (known != tagTable.end()) {
        ++known->second.useCount;
        return known->second.enabled;
    }
    const bool enabled = findVerdict(tag);
    if (remember)
        tagTable.emplace(tag, TagState{1, enabled});
    return enabled;
}

bool Log::findVerdict(const std::string& tag) const {
    for (auto rule = rules.rbegin(); rule != rules.rend(); ++rule) {
        const std::string& pattern = rule->second;
        if (pattern == "*" || tag.compare(0, pattern.size(), pattern) == 0)
            return rule->first;
    }
    return false;
}

bool Log::registerTag(const std::string& tag) {
    return isEnabled(tag, true);
}

std::ostream& Log::getStream() {
    logFile->open();
    // A message may have failed, and memory or the debugger may be there again.
    if (!teeStream || !debugStream) {
        teeStream.clear();
        debugStream.clear();
    }
    return teeStream;
}

std::ostream& Log::beginLine(const LogKey& key) {
    std::ostream& stream = getStream();
    // A width that an earlier message left behind applies to the tag.
    if (stream.width() != 0)
        return stream << key.tag << ": ";
    return stream << key.lineStart;
}

void Log::flush() {
    if (flushEach)
        close();
}

void Log::close() {
    teeStream.flush();
    logFile->close();
}

void Log::dumpTags() {
    static const NoDestructor<LogKey> key("log.dumptags");
    if (!key->isEnabled())
        return;
    writeLine(*key, "available log message tags:");
    for (const auto& entry : tagTable) {
        std::ostringstream line;
        line << (entry.second.enabled ? "on  " : "off ") << std::setw(3) << entry.second.useCount
             << "  " << entry.first;
        writeLine(*key, line.str());
    }
    writeLine(*key, "-- end of log tags --");
}

void Log::writeLine(const LogKey& key, const std::string& message) {
    beginLine(key) << message << '\n';
    flush();
}

LogKey::LogKey(const std::string& siteTag)
    : tag(siteTag), lineStart(siteTag + ": "), enabled(Log::instance().registerTag(siteTag)) {}

RecurringTag::RecurringTag(const std::string& recurringTag) : tag(recurringTag) {}

bool RecurringTag::registerOnceMore() {
    Log& log = Log::instance();
    if (log.serialNumber == logNumber) {
        ++state->useCount;
        return state->enabled;
    }
    const bool enabled = log.registerTag(tag);
    const auto entry = log.tagTable.find(tag);
    if (entry != log.tagTable.end()) {
        logNumber = log.serialNumber;
        state = &entry->second;
    }
    return enabled;
}

}  // namespace pells
