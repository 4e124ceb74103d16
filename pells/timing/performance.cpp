#include "pells/timing/performance.h"

#include <algorithm>
#include <iomanip>
#include <sstream>

#include "pells/core/no_destructor.h"
#include "pells/log/detail/exit_hooks.h"
#include "pells/platform/counter.h"

namespace pells {

template class NamedObject<PerformanceCategory, PerformanceCategory*>;
template class DemandNamedObject<PerformanceCategory, PerformanceCategory*>;

namespace {

void writeLine(const std::string& tag, const std::string& message) {
    Log::instance().getStream() << tag << ": " << message << '\n';
    Log::instance().flush();
}

std::uint32_t percentage(std::uint32_t part, std::uint32_t whole) {
    return whole == 0 ? 0 : static_cast<std::uint32_t>(std::uint64_t{part} * 100 / whole);
}

/// Writes the table of all categories; expects a log.
void writeTimeSummary() {
    static const NoDestructor<LogKey> key("time.summary");
    if (!key->isEnabled())
        return;
    const std::vector<PerformanceCategory*> categories = PerformanceCategory::getAll();
    std::uint32_t sum = 0;
    std::size_t longest = 0;
    for (const PerformanceCategory* category : categories) {
        sum += category->total();
        longest = std::max(longest, category->getName().size());
    }
    const int width = static_cast<int>(longest);

    std::ostringstream line;
    line << std::setw(width) << "Category"
         << "      uS    (%)";
    writeLine(key->getTag(), line.str());
    for (const PerformanceCategory* category : categories) {
        line.str("");
        line << std::setw(width) << category->getName() << "  " << std::setw(6) << category->total()
             << " (" << std::setw(3) << percentage(category->total(), sum) << "%)";
        writeLine(key->getTag(), line.str());
    }
    line.str("");
    line << std::setw(width) << "Total"
         << "  " << std::setw(6) << sum;
    writeLine(key->getTag(), line.str());
}

/// Writes the summary when the library is unloaded, unless the log is gone by then.
class TimeSummaryHook {
public:
    TimeSummaryHook() = default;
    TimeSummaryHook(const TimeSummaryHook&) = delete;
    TimeSummaryHook& operator=(const TimeSummaryHook&) = delete;
    ~TimeSummaryHook() {
        if (!Log::singleton)
            return;
        try {
            writeTimeSummary();
        } catch (...) {
            // There is nobody left to tell.
        }
    }
};

}  // namespace

void detail::installTimeSummaryHook() {
    static TimeSummaryHook hook;
}

PerformanceCategory::PerformanceCategory(const std::string& categoryName)
    : DemandNamedObject<PerformanceCategory, PerformanceCategory*>(categoryName),
      detailTag("time.detail." + categoryName) {}

PerformanceCategory::~PerformanceCategory() = default;

inline std::vector<PerformanceCategory*>& PerformanceCategory::_stack() {
    static NoDestructor<std::vector<PerformanceCategory*>> stack;
    return *stack;
}

std::uint32_t PerformanceCategory::push(PerformanceCategory* category, std::uint32_t t) {
    std::vector<PerformanceCategory*>& stack = _stack();
    if (!stack.empty())
        stack.back()->stop(t);
    stack.push_back(category);
    category->start(t);
    return category->total();
}

std::uint32_t PerformanceCategory::pop(std::uint32_t t) {
    std::vector<PerformanceCategory*>& stack = _stack();
    if (stack.empty())
        return 0;
    PerformanceCategory* const ended = stack.back();
    ended->stop(t);
    stack.pop_back();
    if (!stack.empty())
        stack.back()->start(t);
    return ended->total();
}

inline std::uint32_t Performance::getTimestamp() {
    static const std::uint64_t frequency = platform::counterFrequency();
    const std::uint64_t ticks = platform::counter();
    // Most counters tick in microseconds; dividing 64 bits would cost a good part of a reading.
    if (frequency == 1000000u)
        return static_cast<std::uint32_t>(ticks);
    // The seconds apart: a counter of 10 MHz would leave 64 bits after three weeks.
    const std::uint64_t fraction = ticks % frequency * 1000000u / frequency;
    return static_cast<std::uint32_t>(ticks / frequency * 1000000u + fraction);
}

template <class Label>
inline void Performance::begin(const Label& label) {
    if (enabled)
        logEntry(label);
    categoryTotalAtStart = PerformanceCategory::push(category, startTime);
}

Performance::Performance(const std::string& label, PerformanceCategory* chargedTo)
    : category(chargedTo) {
    begin(label);
}

Performance::Performance(const char* label, PerformanceCategory* chargedTo) : category(chargedTo) {
    begin(label);
}

Performance::~Performance() {
    const std::uint32_t now = getTimestamp();
    const std::uint32_t exclusive = PerformanceCategory::pop(now) - categoryTotalAtStart;
    if (!enabled)
        return;
    try {
        logExit(now - startTime, exclusive);
    } catch (...) {
        // The line is lost, as memory may have run out; the region that was timed is not.
    }
}

void Performance::logEntry(const std::string& label) {
    name = label;
    writeLine(category->detailTag.getTag(), "Entering " + name);
}

void Performance::logExit(std::uint32_t inclusive, std::uint32_t exclusive) const {
    std::ostringstream message;
    message << "Leaving  " << name << " (" << inclusive << " uS, " << exclusive << " uS in "
            << category->getName() << ')';
    writeLine(category->detailTag.getTag(), message.str());
}

}  // namespace pells
