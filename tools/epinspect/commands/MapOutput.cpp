#include "commands/MapOutput.h"

#include <array>

namespace epinspect {

namespace {

/// The members of the flags, for each value of flagsOf(): the same few texts by the million.
std::array<std::string, 16> flagMembers() {
    std::array<std::string, 16> texts;
    for (unsigned int flags = 0; flags < texts.size(); ++flags) {
        const auto value = [flags](unsigned int bit) { return (flags & bit) != 0 ? "true" : "false"; };
        texts[flags] = std::string("\"mapped\":") + value(1) + ",\"vpushed\":" + value(2) + ",\"vpulled\":" + value(4) +
                       ",\"synced\":" + value(8);
    }
    return texts;
}

}  // namespace

std::string lunsText(const std::vector<std::uint32_t>& lids) {
    std::string text = lids.size() == 1 ? "LUN" : "LUNs";
    const char* separator = " ";
    for (const std::uint32_t lid : lids) {
        text += separator + std::to_string(lid);
        separator = ", ";
    }
    return text;
}

void writeRange(LineBuffer& text, std::uint64_t first, std::uint64_t count) {
    text.decimal(first);
    if (count > 1) text.add("-").decimal(first + count - 1);
}

void writeEntries(LineBuffer& text, const MapEntry& entry, std::uint64_t count) {
    if (isHole(entry)) {
        text.add("hole");
        return;
    }
    text.add(entry.mapped ? "mapped" : "unmapped");
    if (entry.vpushed) text.add(" vpushed");
    if (entry.vpulled) text.add(" vpulled");
    if (entry.synced) text.add(" synced");
    text.add(", pool ").decimal(entry.poolNumber).add(count == 1 ? ", extent " : ", extents ");
    writeRange(text, entry.extentAddress, count);
}

void writeRun(LineBuffer& text, const MapRun& run) {
    writeRange(text, run.first, run.count);
    writeEntries(text.add(": "), run.entry, run.count);
    text.add("\n");
}

void writeMembers(Json& object, const MapEntry& entry) {
    static const auto flags = flagMembers();
    object.number("extentAddress", entry.extentAddress)
        .number("poolNumber", entry.poolNumber)
        .ready(flags[flagsOf(entry)]);
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
