#include "map/MapOutput.h"

namespace epinspect {

void writeRange(Text& text, std::uint64_t first, std::uint64_t count) {
    text.decimal(first);
    if (count > 1) text.add("-").decimal(first + count - 1);
}

void writeRun(Text& text, const MapRun& run) {
    writeRange(text, run.first, run.count);
    if (isHole(run.entry)) {
        text.add(": hole\n");
        return;
    }
    text.add(run.entry.mapped ? ": mapped" : ": unmapped");
    if (run.entry.vpushed) text.add(" vpushed");
    if (run.entry.vpulled) text.add(" vpulled");
    if (run.entry.synced) text.add(" synced");
    text.add(", pool ").decimal(run.entry.poolNumber).add(run.count == 1 ? ", extent " : ", extents ");
    writeRange(text, run.entry.extentAddress, run.count);
    text.add("\n");
}

void writeMembers(Json& object, const MapEntry& entry) {
    object.number("extentAddress", entry.extentAddress)
        .number("poolNumber", entry.poolNumber)
        .boolean("mapped", entry.mapped)
        .boolean("vpushed", entry.vpushed)
        .boolean("vpulled", entry.vpulled)
        .boolean("synced", entry.synced);
}

void writeRun(Json& object, const MapRun& run, std::uint64_t entryOffset) {
    object.number("first", run.first).number("count", run.count).number("entryOffset", entryOffset);
    if (isHole(run.entry)) {
        object.boolean("hole", true);
    } else {
        writeMembers(object, run.entry);
    }
}

}  // namespace epinspect
