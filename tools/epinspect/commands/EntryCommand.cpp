// epinspect entry: the map entries of given indexes.
#include <algorithm>
#include <memory>

#include "commands/Commands.h"
#include "commands/MapArguments.h"
#include "commands/MapOutput.h"
#include "frame/Json.h"
#include "frame/Numbers.h"
#include "frame/Output.h"
#include "map/MapWalk.h"
#include "store/ChangeWatch.h"
#include "store/Doubts.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

struct EntryOptions {
    LunName map;
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

/// The map, and how far its entries have come.
struct Work {
    const std::string& name;
    tool::ISCSIEPFileMAP& file;
    std::uint64_t done = 0;
    std::uint64_t total = 0;  ///< entries that will come
};

/// How many entries will come. How many the file holds is looked up only where a range may reach past them.
bool countEntries(const EntryOptions& options, Session& session, Work& work) {
    std::optional<unsigned long long> held;
    for (const Range range : options.ranges) {
        if (range.first == range.last) {
            ++work.total;
            continue;
        }
        if (!held && !session.succeeded(work.file.getEntryCount(held.emplace()), {work.name, ""})) return false;
        if (range.first < *held) work.total += std::min<std::uint64_t>(range.last, *held - 1) - range.first + 1;
    }
    return true;
}

/// The entries of a range up to the first one that is not there.
void printRange(Session& session, Json* json, Work& work, Range range) {
    const WalkEnd walk = walkMap(work.file, range, [&](std::uint64_t index, const auto& entries) {
        for (const MapEntry& entry : entries) printEntry(json, work.file, index++, entry);
        work.done += entries.size();
        session.progress("entries", work.done, work.total);
    });
    const std::uint64_t next = range.first + walk.met;
    const std::string place = "entry " + std::to_string(next);
    if (walk.error != 0) return session.failed({{work.name, place}, walk.error, walk.reason, {}});
    if (next - 1 == range.last) return;
    unsigned long long count = 0;
    if (!session.succeeded(work.file.getEntryCount(count), {work.name, place})) return;
    session.failed(pastEnd(work.name, place, count));
}

void run(const EntryOptions& options, Session& session) {
    const std::optional<NamedMap> named = findMap(session, options.map);
    const std::optional<std::string> path = named ? session.openablePath(named->file, named->by) : std::nullopt;
    if (!path) return;
    const bool walks =
        std::any_of(options.ranges.begin(), options.ranges.end(), [](Range range) { return range.first < range.last; });
    std::optional<ChangeWatch> watch;
    if (walks) watch.emplace(session, named->file, *path);
    tool::ISCSIEPFileMAP file(*path);
    if (!session.succeeded(file.parseHead0(), {named->file, ""})) return;
    remarkOnDataStart(session, file, named->file);
    Json json(named->file, named->lids());
    Work work = {named->file, file};
    if (!countEntries(options, session, work)) return;
    for (const Range range : options.ranges) printRange(session, session.json ? &json : nullptr, work, range);
    if (watch) watch->noticeChange();
}

}  // namespace

void addEntry(Command& parent, Session& session) {
    const auto options = std::make_shared<EntryOptions>();
    Command& command = parent.add("entry", "Show entries of a map");
    addMapArgument(command, options->map);
    command
        .arguments("INDEX", "Index of an entry, from 0; FIRST-LAST for all from FIRST to LAST", options->ranges,
                   parseRange)
        .flag("--json", "One JSON object per entry", session.json)
        .action([options, &session] { run(*options, session); });
}

}  // namespace epinspect
