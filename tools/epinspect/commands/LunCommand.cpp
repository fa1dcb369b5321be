// epinspect lun: the configuration of LUNs and where their map files lie.
#include <memory>

#include "commands/Commands.h"
#include "frame/Json.h"
#include "frame/Numbers.h"
#include "frame/Output.h"
#include "store/Luns.h"

namespace epinspect {

namespace {

void printLun(Session& session, const Lun& lun) {
    if (!session.json) {
        print(forReader(lun.record.toString()) + "\n" + forReader(lun.mapPath) + "\n");
        return;
    }
    const Located map = session.root.locate(lun.mapPath);
    if (const auto obstacle = map.obstacle(lun.mapPath)) session.failed(*obstacle);
    Json object(lun.mapPath);
    object.begin("lun")
        .number("lid", lun.record.lid)
        .number("extentSize", lun.record.extentSize)
        .number("size", lun.record.size)
        .number("restoreTime", lun.record.restoreTime)
        .number("type", lun.record.type)
        .text("uuid", lun.record.uuid)
        .text("rootPath", lun.record.rootPath)
        .text("name", lun.record.name)
        .text("typeName", lun.record.getTypeName());
    if (map.isThere() || map.isMissing()) {
        object.boolean("missing", map.isMissing());
    } else {
        object.null("missing");
    }
    object.end();
}

void printLuns(Session& session, Range lids) {
    const auto print = [&session](const Lun& lun) { printLun(session, lun); };
    if (lids.first < lids.last) {
        forEachLun(session, {lids.first, lids.last}, print);
        return;
    }
    Lun lun;
    const auto lid = static_cast<std::uint32_t>(lids.first);
    if (session.succeeded(loadLun(session, lid, lun), subjectOf({lid, lid}))) print(lun);
}

}  // namespace

void addLun(Command& parent, Session& session) {
    const auto ranges = std::make_shared<std::vector<Range>>();
    parent.add("lun", "Show the configuration of LUNs and the paths of their map files")
        .arguments("LID", "LUN id; FIRST-LAST for those that exist from FIRST to LAST", *ranges, parseRange32)
        .flag("--json", "One JSON object per LUN", session.json)
        .action([ranges, &session] {
            for (const Range range : *ranges) printLuns(session, range);
        });
}

}  // namespace epinspect
