// The search for entries that point at given extents or at a pool.
#pragma once

#include <algorithm>
#include <cstdint>
#include <optional>

#include "Range.h"
#include "map/MapRuns.h"

namespace inspection {

/// Entries of a run that fit a search.
struct RunMatch {
    MapRun run;
    std::optional<std::uint64_t> lowAddress;  ///< the first address, where only the lowest 48 bits of the addresses fit
};

/// What is searched for; where both are given, both must fit.
struct RunSearch {
    std::optional<Range> extents;
    std::optional<std::uint32_t> pool;

    /// Calls emit(match) for the entries of `run` that fit. An extent address fits as it is shown, or without bits 48
    /// to 51. A hole fits nothing.
    template <typename Emit>
    void in(const MapRun& run, Emit&& emit) const {
        if (isHole(run.entry) || (pool && run.entry.poolNumber != *pool)) return;
        if (!extents) return emit(RunMatch{run, std::nullopt});
        std::uint64_t next = 0;
        for (const std::uint64_t address :
             {readAs(run.entry, AddressBits::bits52).extent, readAs(run.entry, AddressBits::bits48).extent}) {
            const bool asShown = address == run.entry.extentAddress;
            const std::uint64_t last = address + run.count - 1;
            if (extents->last < address || extents->first > last) continue;
            const std::uint64_t start = std::max(std::max(extents->first, address) - address, next);
            const std::uint64_t end = std::min(extents->last, last) - address + 1;
            if (start >= end) continue;
            MapRun part = {run.first + start, end - start, run.entry};
            part.entry.extentAddress += start;
            emit(RunMatch{part, asShown ? std::nullopt : std::optional(address + start)});
            next = end;
        }
    }
};

}  // namespace inspection
