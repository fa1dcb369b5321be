// Neighbouring map entries that belong together.
#pragma once

#include <ISCSIEPMapEntryInfo.h>

#include <cstdint>

namespace epinspect {

/// Whether all bits of the entry are zero.
bool isHole(const ISCSI::TOOL::ISCSIEPMapEntryInfo& entry);

/// A run of entries: all holes, or the same flags and pool at extent addresses that follow one another.
struct MapRun {
    std::uint64_t first = 0;
    std::uint64_t count = 0;
    ISCSI::TOOL::ISCSIEPMapEntryInfo entry;  ///< the first one

    bool continuesWith(const ISCSI::TOOL::ISCSIEPMapEntryInfo& next) const;
};

/// How many entries a walk met, and of what kind.
struct MapSummary {
    std::uint64_t entries = 0, mapped = 0, synced = 0, holes = 0, runs = 0;

    void add(const ISCSI::TOOL::ISCSIEPMapEntryInfo& entry);
};

}  // namespace epinspect
