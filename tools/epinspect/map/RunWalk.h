// The walk through a map file, run by run.
#pragma once

#include <string>

#include "Session.h"
#include "map/MapWalk.h"

namespace epinspect {

/// Reports how reading entries of the file that the user called `name` ended: with the code `error` (errno was
/// `reason`), or, unless `complete`, too early. `next` is the first entry that did not come. Returns whether all came.
inline bool allCame(Session& session, const std::string& name, std::uint64_t next, int error, int reason,
                    bool complete) {
    const Subject place = {name, "entry " + std::to_string(next)};
    if (!session.succeeded(error, place, reason)) return false;
    if (complete) return true;
    session.fail(place, "the file has become shorter while it was read", ISCSI::TOOL::EP_ERR_READ_FAILED);
    return false;
}

/// Calls each(run) for the runs of `range` of the file that the user called `name`, all of which the file held when its
/// entries were counted. Returns whether they were still there; reports what failed.
template <typename Each>
bool walkRuns(Session& session, const std::string& name, ISCSI::TOOL::ISCSIEPFileMAP& file, Range range,
              Progress::Beside beside, Each&& each) {
    Progress progress("entries", range.last - range.first + 1, beside);
    MapRuns runs;
    const WalkEnd end = walkMap(file, range, progress,
                                [&](std::uint64_t index, const auto& entries) { runs.add(index, entries, each); });
    runs.finish(each);
    return allCame(session, name, range.first + end.met, end.error, end.reason,
                   end.met > 0 && end.met - 1 == range.last - range.first);
}

}  // namespace epinspect
