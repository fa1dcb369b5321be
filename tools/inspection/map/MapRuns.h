// Neighbouring map entries that belong together.
#pragma once

#include <cstddef>
#include <cstdint>
#include <vector>

#include "map/EntryBits.h"

namespace inspection {

/// Whether `next` continues a run of `count` entries, of which `first` is the first.
inline bool continues(const MapEntry& first, std::uint64_t count, const MapEntry& next) {
    return next.extentAddress == first.extentAddress + (isHole(first) ? 0 : count) &&
           next.poolNumber == first.poolNumber && flagsOf(next) == flagsOf(first);
}

/// A run of entries: all holes, or the same flags and pool at extent addresses that follow one another.
struct MapRun {
    std::uint64_t first = 0;
    std::uint64_t count = 0;
    MapEntry entry;  ///< the first one
};

/// Merges entries, which come block by block, into runs.
class MapRuns {
public:
    /// Takes the entries from index `first` on. Calls emit(run) for every run that ends before the last of them.
    template <typename Emit>
    void add(std::uint64_t first, const std::vector<MapEntry>& entries, Emit&& emit) {
        for (auto next = entries.begin(); next != entries.end();) {
            if (run_.count > 0) {
                const auto end = endOfRun(next, entries.end());
                run_.count += static_cast<std::uint64_t>(end - next);
                if (end == entries.end()) return;
                next = end;
                emit(run_);
            }
            run_ = {first + static_cast<std::uint64_t>(next - entries.begin()), 1, *next};
            ++next;
        }
    }

    /// No more entries come: calls emit() for the last run.
    template <typename Emit>
    void finish(Emit&& emit) {
        if (run_.count > 0) emit(run_);
    }

private:
    using Iterator = std::vector<MapEntry>::const_iterator;

    /// The first entry from `next` on that does not continue the last run.
    Iterator endOfRun(Iterator next, Iterator end) const {
        const bool hole = isHole(run_.entry);
        const auto flags = flagsOf(run_.entry);
        const auto pool = run_.entry.poolNumber;
        const std::uint64_t step = hole ? 0 : 1;
        std::uint64_t address = run_.entry.extentAddress + step * run_.count;
        while (next != end && next->extentAddress == address && next->poolNumber == pool && flagsOf(*next) == flags) {
            address += step;
            ++next;
        }
        return next;
    }

    MapRun run_;
};

/// How many entries a walk met, and of what kind.
struct MapSummary {
    std::uint64_t entries = 0, mapped = 0, unmapped = 0, vpushed = 0, vpulled = 0, synced = 0, holes = 0, runs = 0;

    void add(const MapRun& run);
};

}  // namespace inspection
