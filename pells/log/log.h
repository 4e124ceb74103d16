#pragma once

#include <cstddef>
#include <cstdint>
#include <list>
#include <map>
#include <memory>
#include <new>
#include <ostream>
#include <string>
#include <utility>

#include "pells/core/singleton.h"
#include "pells/log/stream_buffers.h"

namespace pells {

class Log;
namespace detail {
class LogFile;
}
class LogKey;
class RecurringTag;
extern template class PELLS_API RogueSingleton<Log, SingletonFactory<Log>>;
extern template class PELLS_API Singleton<Log, SingletonFactory<Log>>;

/// Tagged diagnostic lines, written to "pells.log" in the current directory and to the debugger.
///
/// A line belongs to a tag, a dotted lower-case word such as "asset.open", and is written when the
/// tag is on. Rules decide: words separated by spaces, tabs and line feeds, each a prefix of tags,
/// or "*" for all of them, with "-" before it to switch them off; the last rule that fits a tag
/// wins, and without one the tag is off. The rules are the preference "logdefault" followed by the
/// preference "log" or, when both are empty, the file "pells.log.prefs" in the current directory,
/// see maximumRulesSize(). They are read once, when the log is created.
///
/// The log is created by the first logging site that runs. When the library is unloaded or the
/// process exits, a log that still exists lists its tags (dumpTags()) and is closed.
///
/// A log file that cannot be opened or written receives nothing more; the debugger still does. So
/// it is with one that is no regular file or a symbolic link: nothing that lies under the name by
/// design or accident makes the program wait, or loses what the link leads to. One thread only.
class PELLS_API Log : public Singleton<Log, SingletonFactory<Log>> {
public:
    ~Log() override;

    /// Where the log goes: a path, "pells.log" unless it was set, or "" for no file, so that only
    /// the debugger gets lines.
    static const std::string& getFileName();

    /// Takes effect when the next log is made.
    static void setFileName(const std::string& path);

    /// How much of "pells.log.prefs" is read, in bytes: 1 MiB unless it was set. Of a longer file
    /// the rest is ignored, from the last separator within the limit on, with a line under "error".
    static std::size_t maximumRulesSize();

    /// Takes effect when the next log is made.
    static void setMaximumRulesSize(std::size_t bytes);

    /// Whether a tag is on. The first verdict on a tag that is kept is final.
    ///
    /// \param tag      compared byte for byte.
    /// \param remember true keeps the verdict in the tag table.
    bool isEnabled(const std::string& tag, bool remember);

    /// isEnabled() that keeps the verdict.
    bool registerTag(const std::string& tag);

    /// The stream to write lines to; (re)opens the file if it is closed. Stays the log's. A mark of
    /// failure that an earlier message left on it is cleared: only the file's own failure lasts.
    std::ostream& getStream();

    /// getStream() after writing the beginning of a line to it: the key's tag and ": ".
    std::ostream& beginLine(const LogKey& key);

    /// Puts everything written so far on disk and closes the file, if the tag "log.flush" is on.
    void flush();

    /// Puts everything written so far on disk and closes the file. The next line reopens it and is
    /// appended.
    void close();

    /// Lists the tags registered so far, each with its verdict and the number of times it was asked
    /// for, under the tag "log.dumptags".
    void dumpTags();

private:
    friend class SingletonFactory<Log>;
    friend class RecurringTag;

    struct TagState {
        int useCount;
        bool enabled;
    };

    /// \throws Prefs::NoImplementation when the application registered no preferences.
    Log();

    void readRules();
    void addRule(const std::string& word);
    void writeHeader();
    bool findVerdict(const std::string& tag) const;
    void writeLine(const LogKey& key, const std::string& message);

    std::list<std::pair<bool, std::string>> rules;
    std::map<std::string, TagState> tagTable;
    bool rulesWereCut;
    std::unique_ptr<detail::LogFile> logFile;
    bool flushEach;
    debugostream debugStream;
    tee_ostream<> teeStream;
    // Unlike its address, no other log of the process has it.
    std::uint64_t serialNumber;
};

/// The tag of one logging site and whether it is on, decided once.
///
/// A site keeps its key for good, so that nothing is looked up and no text is built while its tag
/// is off; PELLS_LOG does all of it. The verdict outlives the log it came from. One thread only.
class PELLS_API LogKey {
public:
    /// Registers the tag with the log, which is created if there is none.
    ///
    /// \throws Prefs::NoImplementation when the log has to be created and the application has
    ///         registered no "Prefs" factory.
    /// Cost: a map look-up; for a new tag also one pass over the rules.
    explicit LogKey(const std::string& siteTag);

    /// The tag, and whether it is on.
    const std::string& getTag() const { return tag; }
    bool isEnabled() const { return enabled; }

private:
    friend class Log;

    std::string tag;
    std::string lineStart;
    bool enabled;
};

/// A tag that is registered over and over, such as that of a probe.
///
/// It saves all registrations with the same log but the first the look-up. One thread only.
class PELLS_API RecurringTag {
public:
    /// Registers nothing yet. \param recurringTag copied.
    explicit RecurringTag(const std::string& recurringTag);

    /// The tag.
    const std::string& getTag() const { return tag; }

    /// Registers the tag once more, as a new LogKey does; the log is created if there is none.
    ///
    /// \return the verdict of the log that there is now.
    /// \throws Prefs::NoImplementation as LogKey does.
    bool registerOnceMore();

private:
    std::string tag;
    // The tag's entry in the table of the log with this number; no log has the number 0.
    std::uint64_t logNumber = 0;
    Log::TagState* state = nullptr;
};

/// Where a logging site keeps its key, which its first run makes; never destroyed.
///
/// A static one needs no initialization, so that a site that is off costs the test of one byte.
class LogSite {
public:
    /// Whether the tag turned out to be off.
    bool isOff() const { return verdict == OFF; }

    /// The site's key, or null when its tag is off. Throws what LogKey throws; then the next call
    /// tries again.
    template <class Tag>
    const LogKey* keyIfOn(const Tag& tag) {
        if (verdict == UNDECIDED)
            verdict = (::new (static_cast<void*>(storage)) LogKey(tag))->isEnabled() ? ON : OFF;
        return verdict == ON ? std::launder(reinterpret_cast<const LogKey*>(storage)) : nullptr;
    }

private:
    enum Verdict : unsigned char { UNDECIDED, OFF, ON };

    Verdict verdict = UNDECIDED;
    alignas(LogKey) unsigned char storage[sizeof(LogKey)] = {};
};

/// Writes one line if the tag is on: the tag, ": ", the message and a line feed.
///
///     PELLS_LOG("app.load", "read " << count << " parts of " << name);
///
/// The message is evaluated only when the tag is on. Format flags that it sets stay set on the
/// log's stream, so it undoes them. The site's key is never destroyed: sites in destructors of
/// static objects work to the end.
#define PELLS_LOG(tag, message)                                                         \
    do {                                                                                \
        static ::pells::LogSite pellsLogSite;                                           \
        if (!pellsLogSite.isOff()) {                                                    \
            if (const ::pells::LogKey* const pellsLogKey = pellsLogSite.keyIfOn(tag)) { \
                ::pells::Log::instance().beginLine(*pellsLogKey) << message << '\n';    \
                ::pells::Log::instance().flush();                                       \
            }                                                                           \
        }                                                                               \
    } while (false)

}  // namespace pells
