// epinspect entry: the map entries of given indexes.
#include <algorithm>
#include <memory>

#include "commands/Commands.h"
#include "commands/MapOutput.h"
#include "frame/Json.h"
#include "frame/Numbers.h"
#include "frame/Output.h"
#include "map/MapWalk.h"
#include "store/Doubts.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

struct EntryOptions {
    std::string file;
    std::vector<Range> ranges;
};

void printEntry(Json* json, const tool::ISCSIEPFileMAP& file, std::uint64_t index, const MapEntry& entry) {
    if (json == nullptr) {
        print(std::to_string(index) + ": " + entry.toString());
        return;
    }
    json->begin("entry").number("index", index).number("entryOffset", entryOffset(file, index));
    writeMembers(*json, entry);
    json->end();
}

/// The entries of a range up to the first one that is not there.
void printRange(const EntryOptions& options, Session& session, Json* json, tool::ISCSIEPFileMAP& file, Range range) {
    unsigned long long count = 0;
    if (range.first < range.last && !session.succeeded(file.getEntryCount(count), {options.file, ""})) return;
    const std::uint64_t end = std::clamp<std::uint64_t>(count, range.first, range.last);
    const WalkEnd walk = walkMap(file, range, [&](std::uint64_t index, const auto& entries) {
        for (const MapEntry& entry : entries) printEntry(json, file, index++, entry);
        session.progress("entries", index - range.first, end - range.first + 1);
    });
    const std::uint64_t next = range.first + walk.met;
    const std::string place = "entry " + std::to_string(next);
    if (walk.error != 0) return session.failed({{options.file, place}, walk.error, walk.reason, {}});
    if (next - 1 == range.last) return;
    if (!session.succeeded(file.getEntryCount(count), {options.file, place})) return;
    session.failed(pastEnd(options.file, place, count));
}

void run(const EntryOptions& options, Session& session) {
    const std::optional<std::string> path = session.openablePath(options.file, NamedBy::user);
    if (!path) return;
    tool::ISCSIEPFileMAP file(*path);
    if (!session.succeeded(file.parseHead0(), {options.file, ""})) return;
    remarkOnDataStart(session, file, options.file);
    Json json(options.file);
    for (const Range range : options.ranges) printRange(options, session, session.json ? &json : nullptr, file, range);
}

}  // namespace

void addEntry(Command& parent, Session& session) {
    const auto options = std::make_shared<EntryOptions>();
    parent.add("entry", "Show entries of a map file")
        .argument("MAPFILE", "Map file of a LUN", options->file)
        .arguments("INDEX", "Index of an entry, from 0; FIRST-LAST for all from FIRST to LAST", options->ranges,
                   parseRange)
        .flag("--json", "One JSON object per entry", session.json)
        .action([options, &session] { run(*options, session); });
}

}  // namespace epinspect
