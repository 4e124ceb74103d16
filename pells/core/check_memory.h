#pragma once

#include <string>

#include "pells/core/export.h"

namespace pells {

/// Hooks for a debugging allocator. Without one, they keep named records and report nothing.
class PELLS_API CheckMemory {
public:
    CheckMemory() = delete;

    /// Does nothing without a debugging allocator.
    static void startMemCheck();

    /// Would stop the program at an allocation of that number; does nothing without a debugging
    /// allocator.
    static void breakAt(long allocationNumber);

    /// Starts tracking under a name, replacing the record that stood there.
    static void setMemTracking(const std::string& name);

    /// Drops the record of a name; an absent name is no error.
    static void removeMemTracking(const std::string& name);

    /// Looks the record up; there is nothing to report without a debugging allocator.
    static void dumpMemory(const std::string& name);
};

}  // namespace pells
