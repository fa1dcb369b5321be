// A map file that is about to be walked.
#pragma once

#include <ISCSIEPFileMAP.h>

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "map/MapWalk.h"
#include "store/ChangeWatch.h"

namespace inspection {

struct OpenedMap {
    std::unique_ptr<ISCSI::TOOL::ISCSIEPFileMAP> file;  ///< HEAD[0] is decoded; null after a failure
    std::uint64_t entries = 0;                          ///< how many the file holds
    std::optional<ChangeWatch> watch;                   ///< from before it was opened; to be asked after the walk
};

/// Opens the map file that messages call `name` and remarks on what is doubtful about it. Reports failures.
OpenedMap openMap(Context& context, const std::string& name, NamedBy by);

/// Calls each(run) for all `entries` entries of the map file that messages call `name`, and shows the progress. Returns
/// whether all came; reports the failure when they did not.
template <typename Each>
bool walkAllRuns(Context& context, const std::string& name, ISCSI::TOOL::ISCSIEPFileMAP& file, std::uint64_t entries,
                 Each&& each) {
    if (entries == 0) return true;
    const auto progress = [&](std::uint64_t done) { context.progress("entries", done, entries); };
    const auto failure = walkRuns(name, file, {0, entries - 1}, progress, each);
    if (failure) context.failed(*failure);
    return !failure;
}

/// The same of a map file at `hostPath` that has been walked before: there is no more to say about it.
template <typename Each>
bool walkAgain(Context& context, const std::string& name, const std::string& hostPath, Each&& each) {
    ISCSI::TOOL::ISCSIEPFileMAP file(hostPath);
    unsigned long long entries = 0;
    return context.succeeded(file.getEntryCount(entries), {name, ""}) &&
           walkAllRuns(context, name, file, entries, each);
}

}  // namespace inspection
