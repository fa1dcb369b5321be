#include "store/Luns.h"

#include <ISCSIEPFileMAP.h>

#include <algorithm>
#include <map>

namespace inspection {

namespace tool = ISCSI::TOOL;

int loadLun(Context& context, std::uint32_t lid, Lun& lun) {
    context.prepareLuns();
    lun.record = tool::ISCSILUNConfInfo(lid);
    const int error = lun.record.loadFromConfig();
    return error != 0 ? error : tool::ISCSIEPFileMAP().getMAPFilePath(lid, lun.mapPath);
}

Subject subjectOf(Range lids) {
    return {"", "LUN " + std::to_string(lids.first) + (lids.first == lids.last ? "" : "-" + std::to_string(lids.last))};
}

bool forEachLun(Context& context, Range range, const std::function<void(const Lun&)>& each) {
    struct Failures {
        std::uint64_t count = 0, firstId = 0;
    };
    const Trial trial(context);
    std::map<int, Failures> failures;  // by code
    Lun lun;
    bool met = false;
    for (std::uint64_t id = range.first; id <= range.last; ++id) {
        const int error = loadLun(context, static_cast<std::uint32_t>(id), lun);
        if (error == 0) {
            met = true;
            each(lun);
        } else if (failures[error].count++ == 0) {
            failures[error].firstId = id;
        }
        context.progress("LUN ids", id - range.first, range.last - range.first + 1);
    }
    // Which code stands for "no such LUN" is not documented: the most frequent one does, any other is a failure.
    const auto frequent = std::max_element(
        failures.begin(), failures.end(), [](const auto& a, const auto& b) { return a.second.count < b.second.count; });
    for (auto failure = failures.begin(); failure != failures.end(); ++failure) {
        const std::uint64_t id = failure->second.firstId;
        if (failure == frequent) continue;
        context.succeeded(loadLun(context, static_cast<std::uint32_t>(id), lun), subjectOf({id, id}));
    }
    return met;
}

}  // namespace inspection
