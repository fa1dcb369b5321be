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

void printLuns(Session& session, Range range) {
    const auto print = [&session](const Lun& lun) { printLun(session, lun); };
    if (range.first < range.last && forEachLun(session, range, print)) return;
    std::optional<Trial> trial;
    if (range.first < range.last) trial.emplace(session);
    // A single id; or none of the range exists, and the first one tells why.
    Lun lun;
    if (session.succeeded(loadLun(session, static_cast<std::uint32_t>(range.first), lun), subjectOf(range))) print(lun);
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
