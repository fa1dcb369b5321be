// epinspect find: which map entries point at given extents or at a pool.
#include <memory>

#include "commands/Commands.h"
#include "commands/MapArguments.h"
#include "commands/MapOutput.h"
#include "frame/Json.h"
#include "frame/Numbers.h"
#include "frame/Output.h"
#include "map/RunSearch.h"
#include "store/ChosenFiles.h"
#include "store/Luns.h"
#include "store/OpenMap.h"

namespace epinspect {

namespace {

struct FindOptions {
    std::vector<LunName> maps;
    Lids lids = usualLids;
    RunSearch search;
};

struct FindSummary {
    std::uint64_t files = 0, entries = 0, matches = 0, matchedEntries = 0;
};

/// The map that is searched, and how its matches are written.
struct SearchedMap {
    const std::string& name;
    std::vector<std::uint32_t> lids;
    const ISCSI::TOOL::ISCSIEPFileMAP& file;
    Json json;
    LineBuffer line;
};

void printMatch(SearchedMap& map, const RunMatch& match) {
    LineBuffer& line = map.line;
    line.clear();
    line.add(forReader(map.name), ": ");
    if (!map.lids.empty()) line.add(lunsText(map.lids), ": ");
    writeRange(line, match.run.first, match.run.count);
    writeEntries(line.add(": "), match.run.entry, match.run.count);
    if (match.lowAddress) {
        line.add(match.run.count == 1 ? " (extent " : " (extents ");
        writeRange(line, *match.lowAddress, match.run.count);
        line.add(" where bits 48 to 51 belong to the pool alone)");
    }
    print(line.add("\n").view());
}

void printMatchAsJson(SearchedMap& map, const RunMatch& match) {
    Json& json = map.json;
    writeRun(json.begin("match"), match.run, entryOffset(map.file, match.run.first));
    if (match.lowAddress) json.number("addressBits", 48);
    json.end();
}

void searchMap(const FindOptions& options, Session& session, const StoreFile& file, FindSummary& summary) {
    const OpenedMap map = openMap(session, file.path, file.by);
    if (!map.file) return;
    ++summary.files;
    const std::vector<std::uint32_t> lids = lidsOf(file.luns);
    SearchedMap searched = {file.path, lids, *map.file, Json(file.path, lids), LineBuffer()};
    const auto each = [&](const MapRun& run) {
        summary.entries += run.count;
        options.search.in(run, [&](const RunMatch& match) {
            ++summary.matches;
            summary.matchedEntries += match.run.count;
            if (session.json) {
                printMatchAsJson(searched, match);
            } else {
                printMatch(searched, match);
            }
        });
    };
    walkAllRuns(session, file.path, *map.file, map.entries, each);
    map.watch->noticeChange();
}

void printSummary(const FindSummary& summary) {
    print(counted(summary.entries, "entry", "entries") + " in " + counted(summary.files, "map", "maps") + ": " +
          counted(summary.matches, "match", "matches") + " of " + counted(summary.matchedEntries, "entry", "entries") +
          "\n");
}

void printSummaryAsJson(const FindSummary& summary, const std::vector<std::string>& changed) {
    Json json("");
    json.begin("summary")
        .boolean("summary", true)
        .number("files", summary.files)
        .number("entries", summary.entries)
        .number("matches", summary.matches)
        .number("matchedEntries", summary.matchedEntries)
        .texts("changed", changed)
        .end();
}

void run(const FindOptions& options, Session& session) {
    if (!options.search.extents && !options.search.pool) throw UsageError{"--extent or --pool is missing"};
    FindSummary summary;
    ChosenFiles(session, options.maps, options.lids).forEach([&](const StoreFile& file) {
        const bool isMap = file.kind != nullptr && file.kind->type == ISCSI::TOOL::EP_FILE_TYPE_MAP;
        if (options.maps.empty() && !isMap) return;
        searchMap(options, session, file, summary);
    });
    if (session.json) {
        printSummaryAsJson(summary, session.changedFiles());
    } else {
        printSummary(summary);
    }
}

}  // namespace

void addFind(Command& parent, Session& session) {
    const auto options = std::make_shared<FindOptions>();
    Command& command = parent.add("find", "Show which map entries point at given extents or at a pool");
    command
        .arguments("MAP", "Maps to search: LUN ids, or paths of map files (default: all of the store)", options->maps,
                   parseMap, Command::Need::severalOrNone)
        .option("--extent", "N", "Extent address; FIRST-LAST for all from FIRST to LAST", options->search.extents,
                parseRange)
        .option("--pool", "N", "Pool number; with --extent, both must fit", options->search.pool, parseNumber32);
    addLunsOption(command, options->lids);
    command.flag("--json", "One JSON object per match, then a summary", session.json).action([options, &session] {
        run(*options, session);
    });
}

}  // namespace epinspect
