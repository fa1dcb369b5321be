// The walk through a map file, in constant memory.
#pragma once

#include <ISCSIEPFileMAP.h>

#include <algorithm>
#include <cerrno>
#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "Failure.h"
#include "Range.h"
#include "map/MapRuns.h"

namespace inspection {

struct WalkEnd {
    int error;          ///< 0, or the code of the read that failed
    int reason;         ///< the errno value of that read
    std::uint64_t met;  ///< how many entries came before that; fewer than in the range where the file has ended
};

/// Calls visit(index, entries) for one block after the other of the entries of `range`, up to the end of the file.
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

/// The failure that ended a read of entries from the file that the user called `name`; nothing when it was `complete`.
/// `error` is the code of that read and `reason` its errno value; without them the file has become shorter. `next` is
/// the first entry that did not come.
inline std::optional<Failure> endOfRead(const std::string& name, std::uint64_t next, int error, int reason,
                                        bool complete) {
    const Subject place = {name, "entry " + std::to_string(next)};
    if (error != 0) return Failure{place, error, reason, {}};
    if (complete) return std::nullopt;
    return Failure{place, ISCSI::TOOL::EP_ERR_READ_FAILED, 0, "the file has become shorter while it was read"};
}

/// Calls each(run) for the runs of `range`, and progress(done) now and then. The file, which the user called `name`,
/// held all of the range when its entries were counted. Returns what failed.
template <typename Progress, typename Each>
std::optional<Failure> walkRuns(const std::string& name, ISCSI::TOOL::ISCSIEPFileMAP& file, Range range,
                                Progress&& progress, Each&& each) {
    MapRuns runs;
    const WalkEnd end = walkMap(file, range, [&](std::uint64_t index, const auto& entries) {
        runs.add(index, entries, each);
        progress(index - range.first + entries.size());
    });
    runs.finish(each);
    return endOfRead(name, range.first + end.met, end.error, end.reason,
                     end.met > 0 && end.met - 1 == range.last - range.first);
}

}  // namespace inspection
