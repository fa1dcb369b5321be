// epinspect map: all entries of a map file, as runs or as a picture.
#include <limits>
#include <memory>

#include "commands/Chart.h"
#include "commands/Commands.h"
#include "commands/MapArguments.h"
#include "commands/MapOutput.h"
#include "frame/Json.h"
#include "frame/Numbers.h"
#include "frame/Output.h"
#include "map/MapWalk.h"
#include "store/OpenMap.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

struct MapOptions {
    LunName map;
    std::uint64_t first = 0;
    std::uint64_t count = std::numeric_limits<std::uint64_t>::max();
    bool chart = false;
};

std::string textOf(const NamedMap& map, const MapSummary& summary) {
    return (map.luns.empty() ? "" : lunsText(map.lids()) + ": ") + counted(summary.entries, "entry", "entries") +
           " in " + counted(summary.runs, "run", "runs") + ": " + std::to_string(summary.mapped) + " mapped, " +
           std::to_string(summary.unmapped) + " unmapped, " + counted(summary.holes, "hole", "holes") + "; " +
           std::to_string(summary.vpushed) + " vpushed, " + std::to_string(summary.vpulled) + " vpulled, " +
           std::to_string(summary.synced) + " synced";
}

void printSummary(Json& json, const MapSummary& summary, const std::vector<std::string>& changed) {
    json.begin("summary")
        .boolean("summary", true)
        .number("entries", summary.entries)
        .number("mapped", summary.mapped)
        .number("unmapped", summary.unmapped)
        .number("vpushed", summary.vpushed)
        .number("vpulled", summary.vpulled)
        .number("synced", summary.synced)
        .number("holes", summary.holes)
        .number("runs", summary.runs)
        .texts("changed", changed)
        .end();
}

void run(const MapOptions& options, Session& session) {
    const std::optional<NamedMap> named = findMap(session, options.map);
    if (!named) return;
    const OpenedMap map = openMap(session, named->file, named->by);
    if (!map.file) return;
    tool::ISCSIEPFileMAP& file = *map.file;
    const std::uint64_t total = map.entries;
    if (options.first > 0 && options.first >= total) {
        session.failed(pastEnd(named->file, "entry " + std::to_string(options.first), total));
        return;
    }
    const std::uint64_t count = std::min(options.count, total - options.first);
    Chart chart(options.first, count, outputWidth());
    MapSummary summary;
    Json json(named->file, named->lids());
    LineBuffer line;
    const auto each = [&](const MapRun& run) {
        summary.add(run);
        if (options.chart) {
            chart.add(run.entry.mapped, run.count);
        } else if (session.json) {
            writeRun(json.begin("run"), run, entryOffset(file, run.first));
            json.end();
        } else {
            line.clear();
            writeRun(line, run);
            print(line.view());
        }
    };
    session.listing = !options.chart;
    const Range range = {options.first, options.first + count - 1};
    const auto progress = [&](std::uint64_t done) { session.progress("entries", done, count); };
    const auto failure = count > 0 ? walkRuns(named->file, file, range, progress, each) : std::nullopt;
    if (failure) session.failed(*failure);
    map.watch->noticeChange();
    if (failure) return;
    if (session.json) {
        printSummary(json, summary, session.changedFiles());
    } else if (options.chart) {
        print(chart.draw(outputIsUnicode(), "entry", "entries") +
              Chart::legend(outputIsUnicode(), outputWidth(), "Mapped", "") +
              wrapped(textOf(*named, summary), outputWidth(), 0));
    } else {
        print(textOf(*named, summary) + "\n");
    }
}

}  // namespace

void addMap(Command& parent, Session& session) {
    const auto options = std::make_shared<MapOptions>();
    Command& command = parent.add("map", "Show all entries of a map, merged into runs");
    addMapArgument(command, options->map);
    command.option("--first", "N", "Index to start at (default: 0)", options->first, parseNumber)
        .option("--count", "N", "Entries to show at most (default: all to the end of the file)", options->count,
                parseNumber)
        .flag("--chart", "A picture instead of the runs", options->chart)
        .flag("--json", "One JSON object per run, then a summary", session.json)
        .exclusive("--chart", "--json")
        .action([options, &session] { run(*options, session); });
}

}  // namespace epinspect
