// epinspect map: all entries of a map file, as runs or as a picture.
#include <limits>
#include <memory>

#include "Json.h"
#include "Output.h"
#include "commands/Commands.h"
#include "map/MapChart.h"
#include "map/MapOutput.h"
#include "map/MapWalk.h"
#include "store/Doubts.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

struct MapOptions {
    std::string file;
    std::uint64_t first = 0;
    std::uint64_t count = std::numeric_limits<std::uint64_t>::max();
    bool chart = false;
};

std::string counted(std::uint64_t count, const char* one, const char* several) {
    return std::to_string(count) + " " + (count == 1 ? one : several);
}

void printSummary(const MapSummary& summary, unsigned int width) {
    const std::string text =
        counted(summary.entries, "entry", "entries") + " in " + counted(summary.runs, "run", "runs") + ": " +
        std::to_string(summary.mapped) + " mapped, " + std::to_string(summary.unmapped) + " unmapped, " +
        counted(summary.holes, "hole", "holes") + "; " + std::to_string(summary.vpushed) + " vpushed, " +
        std::to_string(summary.vpulled) + " vpulled, " + std::to_string(summary.synced) + " synced";
    print(wrapped(text, width, 0));
}

void printSummary(Json& json, const MapSummary& summary) {
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
        .end();
}

/// Walks `range`, which the file held when its entries were counted, and gives the runs to each(run). Returns whether
/// all entries were still there.
template <typename Each>
bool walkRuns(const MapOptions& options, Session& session, tool::ISCSIEPFileMAP& file, Range range, Each&& each) {
    Progress progress("entries", range.last - range.first + 1,
                      options.chart ? Progress::Beside::nothing : Progress::Beside::listing);
    MapRuns runs;
    const WalkEnd end = walkMap(file, range, progress,
                                [&](std::uint64_t index, const auto& entries) { runs.add(index, entries, each); });
    runs.finish(each);
    const std::uint64_t next = range.first + end.met;
    const Subject place = {options.file, "entry " + std::to_string(next)};
    if (!session.succeeded(end.error, place, end.reason)) return false;
    if (next - 1 == range.last) return true;
    session.fail(place, "the file has become shorter while it was read", tool::EP_ERR_READ_FAILED);
    return false;
}

void run(const MapOptions& options, Session& session) {
    const std::optional<std::string> path = session.openablePath(options.file);
    if (!path) return;
    tool::ISCSIEPFileMAP file(*path);
    unsigned long long total = 0;
    if (!session.succeeded(file.parseHead0(), {options.file, ""})) return;
    if (!session.succeeded(file.getEntryCount(total), {options.file, ""})) return;
    sayDataStartDoubts(file, options.file);
    sayPartialEntry(file, options.file);
    if (options.first > 0 && options.first >= total) {
        session.failBeyondEnd(options.file, "entry " + std::to_string(options.first), total);
        return;
    }
    const std::uint64_t count = std::min<std::uint64_t>(options.count, total - options.first);
    const unsigned int width = options.chart ? outputWidth() : std::numeric_limits<unsigned int>::max();
    MapChart chart(options.first, count, width);
    MapSummary summary;
    Json json(options.file);
    Text line;
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
    if (count > 0 && !walkRuns(options, session, file, {options.first, options.first + count - 1}, each)) return;
    if (options.chart) print(chart.draw(outputIsUnicode()));
    if (session.json) {
        printSummary(json, summary);
    } else {
        printSummary(summary, width);
    }
}

}  // namespace

void addMap(Command& parent, Session& session) {
    const auto options = std::make_shared<MapOptions>();
    parent.add("map", "Show all entries of a map file, merged into runs")
        .argument("MAPFILE", "Map file of a LUN", options->file)
        .option("--first", "N", "Index to start at (default: 0)", options->first, parseNumber)
        .option("--count", "N", "Entries to show at most (default: all to the end of the file)", options->count,
                parseNumber)
        .flag("--chart", "A picture instead of the runs", options->chart)
        .flag("--json", "One JSON object a run, then one that sums up", session.json)
        .exclusive("--chart", "--json")
        .action([options, &session] { run(*options, session); });
}

}  // namespace epinspect
