#include "store/Luns.h"

#include <ISCSIEPFileMAP.h>

#include <limits>

#include "Progress.h"
#include "SystemLog.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

int loadLun(std::uint32_t lid, Lun& lun) {
    lun.record = tool::ISCSILUNConfInfo(lid);
    const int error = lun.record.loadFromConfig();
    return error != 0 ? error : tool::ISCSIEPFileMAP().getMAPFilePath(lid, lun.mapPath);
}

Subject subjectOf(Range lids) {
    return {"", "LUN " + std::to_string(lids.first) + (lids.first == lids.last ? "" : "-" + std::to_string(lids.last))};
}

bool forEachLun(Session& session, Range range, const std::function<void(const Lun&)>& each) {
    const QuietLog quiet;
    Progress progress("LUN ids", range.last - range.first + 1, Progress::Beside::listing);
    Lun lun;
    // Which code stands for "no such LUN" is the platform's secret; the largest id, which no LUN has, tells it.
    const int noSuchLun = loadLun(std::numeric_limits<std::uint32_t>::max(), lun);
    bool met = false;
    for (std::uint64_t id = range.first; id <= range.last; ++id) {
        const auto lid = static_cast<std::uint32_t>(id);
        const int error = loadLun(lid, lun);
        progress.show(id - range.first);
        if (error == noSuchLun && error != 0) continue;
        met = true;
        if (session.succeeded(error, subjectOf({id, id}))) each(lun);
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
