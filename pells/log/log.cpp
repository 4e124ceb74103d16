#include "pells/log/log.h"

#include <ctime>
#include <iomanip>
#include <sstream>
#include <vector>

#include "pells/core/no_destructor.h"
#include "pells/core/prefs.h"
#include "pells/core/strings.h"
#include "pells/log/exit_hooks.h"
#include "pells/log/number_format.h"

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
        Log::singleton->dumpTags();
        Log::singleton->close();
    }
};

/// Both hooks, in the order of construction whose reverse is the order of the farewell: the time
/// summary is written before the log lists its tags and closes.
[[maybe_unused]] const bool exitHooksInstalled = [] {
    static LogExitHook logExitHook;
    installTimeSummaryHook();
    return true;
}();

std::uint64_t logsMade = 0;

const char prefsFileName[] = "pells.log.prefs";

std::string readPrefsFile() {
    std::string text;
    std::ifstream file(prefsFileName);
    char piece[512];
    do {
        file.read(piece, sizeof piece);
        text.append(piece, static_cast<std::string::size_type>(file.gcount()));
    } while (file);
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

Log::Log()
    : openMode(std::ios_base::out | std::ios_base::trunc),
      flushEach(false),
      teeStream(debugStream, logFile),
      serialNumber(++logsMade) {
    // An application that has chosen another locale for its streams finds its forms in the log.
    if (teeStream.getloc() == std::locale::classic())
        teeStream.imbue(fastClassicLocale());
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
        text += readPrefsFile();

    std::vector<std::string> tokens;
    string_split(text, " \t\n", tokens);
    for (const std::string& token : tokens) {
        const bool enabled = token[0] != '-';
        const bool hasSign = token[0] == '+' || token[0] == '-';
        const std::string pattern = token.substr(hasSign ? 1 : 0);
        if (!pattern.empty())
            rules.emplace_back(enabled, pattern);
    }
}

void Log::writeHeader() {
    const std::string line(75, '-');
    getStream() << line << "\nMirrik Pells - " << localTime() << '\n' << line << '\n';
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
    // The buffer is opened directly: the stream's own open() would clear the mark of a failure, and
    // a file that failed once receives no more text.
    if (!logFile.is_open()) {
        if (!logFile.rdbuf()->open("pells.log", openMode | std::ios_base::out))
            logFile.setstate(std::ios_base::failbit);
        openMode = std::ios_base::out | std::ios_base::app;
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
    if (logFile.is_open())
        logFile.close();
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
