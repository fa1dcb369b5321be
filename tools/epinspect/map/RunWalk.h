// The walk through a map file, run by run.
#pragma once

#include "Session.h"
#include "map/MapWalk.h"

namespace epinspect {

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
    const std::uint64_t next = range.first + end.met;
    const Subject place = {name, "entry " + std::to_string(next)};
    if (!session.succeeded(end.error, place, end.reason)) return false;
    if (next - 1 == range.last) return true;
    session.fail(place, "the file has become shorter while it was read", ISCSI::TOOL::EP_ERR_READ_FAILED);
    return false;
}

}  // namespace epinspect
