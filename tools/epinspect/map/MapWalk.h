// The walk through a map file, in constant memory.
#pragma once

#include <ISCSIEPFileMAP.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <limits>
#include <vector>

#include "Numbers.h"
#include "Progress.h"
#include "map/MapRuns.h"

namespace epinspect {

/// Where an entry lies in the file, counted from its start.
inline std::uint64_t entryOffset(const ISCSI::TOOL::ISCSIEPFileMAP& file, std::uint64_t index) {
    return file.head0DataStartOffset + 8 * index;
}

/// Whether entry `index` of `file`, whose HEAD[0] is decoded, lies where a file can have bytes: below 2^63.
inline bool isReachable(const ISCSI::TOOL::ISCSIEPFileMAP& file, std::uint64_t index) {
    constexpr auto limit = static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max());
    return file.head0DataStartOffset <= limit && index < (limit - file.head0DataStartOffset) / 8;
}

struct WalkEnd {
    int error;          ///< 0, or the code of the read that failed
    int reason;         ///< the errno value of that read
    std::uint64_t met;  ///< how many entries came before; fewer than the range holds where the file ends before
};

/// Calls visit(index, entries) for one block after the other of the entries of `range`, as far as the file goes.
/// HEAD[0] must have been decoded.
template <typename Visit>
WalkEnd walkMap(ISCSI::TOOL::ISCSIEPFileMAP& file, Range range, Visit&& visit) {
    constexpr std::uint64_t blockSize = 4096;
    std::vector<MapEntry> entries;
    std::uint64_t met = 0;
    while (isReachable(file, range.first + met)) {
        const auto wanted = std::min(range.last - range.first - met, blockSize - 1) + 1;
        const int error = file.getMapEntries(range.first + met, wanted, entries);
        if (error != 0) return {error, errno, met};
        if (!entries.empty()) visit(range.first + met, entries);
        met += entries.size();
        if (entries.size() < wanted || met - 1 == range.last - range.first) break;
    }
    return {0, 0, met};
}

/// The same, with a sign of life that counts entries.
template <typename Visit>
WalkEnd walkMap(ISCSI::TOOL::ISCSIEPFileMAP& file, Range range, Progress& progress, Visit&& visit) {
    return walkMap(file, range, [&](std::uint64_t index, const auto& entries) {
        visit(index, entries);
        progress.show(index - range.first + entries.size());
    });
}

}  // namespace epinspect
