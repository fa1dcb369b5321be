#include "store/Luns.h"

#include <ISCSIEPFileMAP.h>

#include <algorithm>
#include <map>

#include "Progress.h"
#include "SystemLog.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

int loadLun(Session& session, std::uint32_t lid, Lun& lun) {
    session.prepareLuns();
    lun.record = tool::ISCSILUNConfInfo(lid);
    const int error = lun.record.loadFromConfig();
    return error != 0 ? error : tool::ISCSIEPFileMAP().getMAPFilePath(lid, lun.mapPath);
}

Subject subjectOf(Range lids) {
    return {"", "LUN " + std::to_string(lids.first) + (lids.first == lids.last ? "" : "-" + std::to_string(lids.last))};
}

bool forEachLun(Session& session, Range range, const std::function<void(const Lun&)>& each) {
    struct Failures {
        std::uint64_t count = 0, firstId = 0;
    };
    const QuietLog quiet;
    Progress progress("LUN ids", range.last - range.first + 1, Progress::Beside::listing);
    std::map<int, Failures> failures;  // by code
    Lun lun;
    bool met = false;
    for (std::uint64_t id = range.first; id <= range.last; ++id) {
        const int error = loadLun(session, static_cast<std::uint32_t>(id), lun);
        if (error == 0) {
            met = true;
            each(lun);
        } else if (failures[error].count++ == 0) {
            failures[error].firstId = id;
        }
        progress.show(id - range.first);
    }
    // Which code stands for "no such LUN" is the platform's secret: the most frequent one does, any other is a failure.
    const auto frequent = std::max_element(
        failures.begin(), failures.end(), [](const auto& a, const auto& b) { return a.second.count < b.second.count; });
    for (auto failure = failures.begin(); failure != failures.end(); ++failure) {
        const std::uint64_t id = failure->second.firstId;
        if (failure == frequent) continue;
        session.succeeded(loadLun(session, static_cast<std::uint32_t>(id), lun), subjectOf({id, id}));
    }
    return met;
}

std::string typeNameOf(const tool::ISCSILUNConfInfo& lun) {
    const std::string text = lun.toString();  // before the type it holds numbers and a time
    const std::string before = " ,type: ";
    const auto start = text.find(before) + before.size();
    return text.substr(start, text.find(" ,uuid: ", start) - start);
}

void writeMembers(Json& object, const tool::ISCSILUNConfInfo& lun) {
    object.number("lid", lun.lid)
        .number("extentSize", lun.extentSize)
        .number("size", lun.size)
        .number("restoreTime", lun.restoreTime)
        .number("type", lun.type)
        .text("uuid", lun.uuid)
        .text("rootPath", lun.rootPath)
        .text("name", lun.name);
}

}  // namespace epinspect
