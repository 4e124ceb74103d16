#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "pells/core/named_object.h"
#include "pells/log/log.h"

namespace pells {

class PerformanceCategory;
extern template class PELLS_API NamedObject<PerformanceCategory, PerformanceCategory*>;
extern template class PELLS_API DemandNamedObject<PerformanceCategory, PerformanceCategory*>;

/// A named account of time, in microseconds, that probes charge.
///
/// Categories are found by name with find() or findp(), made when first asked for, and live until
/// the process ends. Of the categories whose probes are running only the innermost is charged, so a
/// total is exclusive: it leaves out what nested probes charge to others. Times are counted modulo
/// 2^32 microseconds (71.6 minutes). One thread only.
class PELLS_API PerformanceCategory
    : public DemandNamedObject<PerformanceCategory, PerformanceCategory*> {
public:
    /// Made by find() and findp(). \param categoryName what the log and the summary call it.
    explicit PerformanceCategory(const std::string& categoryName);
    ~PerformanceCategory() override;

    /// Counts from the time t on.
    void start(std::uint32_t t) { startTime = t; }

    /// Adds the time since the last start() or stop() to the total, and counts from t on.
    /// \return what was added.
    std::uint32_t stop(std::uint32_t t) {
        const std::uint32_t elapsed = t - startTime;
        totalTime += elapsed;
        startTime = t;
        return elapsed;
    }

    /// The time charged so far, in microseconds, without that of a probe that is running.
    std::uint32_t total() const { return totalTime; }

    /// Makes a category the running one at the time t; the one that ran until then waits.
    /// \return the total of the new category.
    static std::uint32_t push(PerformanceCategory* category, std::uint32_t t);

    /// Ends the running category at the time t and resumes the one that waits below it.
    /// \return the total of the ended category; 0 when none is running.
    static std::uint32_t pop(std::uint32_t t);

private:
    friend class Performance;

    static std::vector<PerformanceCategory*>& _stack();

    std::uint32_t startTime = 0;
    std::uint32_t totalTime = 0;
    RecurringTag detailTag;
};

/// Charges the time from its construction to its destruction to a category.
///
/// Probes nest: they die in the reverse order of their making. With the tag "time.detail." followed
/// by the category's name on, entry and exit are logged; the line at the exit gives the whole time
/// of the probe and, of it, the category's own share. When the library is unloaded or the process
/// exits, a log that still exists receives the totals of all categories under "time.summary".
class PELLS_API Performance {
public:
    /// Registers the category's tag once more.
    ///
    /// \param label     names the probe in the log; copied if the tag is on, else not looked at.
    /// \param chargedTo not null; not owned.
    /// \throws Prefs::NoImplementation as LogKey does.
    Performance(const std::string& label, PerformanceCategory* chargedTo);
    Performance(const char* label, PerformanceCategory* chargedTo);
    ~Performance();
    Performance(const Performance&) = delete;
    Performance& operator=(const Performance&) = delete;

private:
    static std::uint32_t getTimestamp();
    template <class Label>
    void begin(const Label& label);
    void logEntry(const std::string& label);
    void logExit(std::uint32_t inclusive, std::uint32_t exclusive) const;

    // Empty while the tag is off.
    std::string name;
    PerformanceCategory* category;
    std::uint32_t startTime = getTimestamp();
    bool enabled = category->detailTag.registerOnceMore();
    std::uint32_t categoryTotalAtStart;
};

}  // namespace pells
