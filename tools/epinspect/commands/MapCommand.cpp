// epinspect map: all entries of a map file, as runs or as a picture.
#include <CLI/App.hpp>
#include <filesystem>
#include <limits>
#include <memory>

#include "Json.h"
#include "Numbers.h"
#include "Output.h"
#include "commands/Commands.h"
#include "map/MapChart.h"
#include "map/MapRuns.h"
#include "map/MapWalk.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

struct MapOptions {
    std::string file;
    std::uint64_t first = 0;
    std::uint64_t count = std::numeric_limits<std::uint64_t>::max();
    bool chart = false;
    bool json = false;
};

/// "FIRST-LAST", or the one number when both are the same.
std::string range(std::uint64_t first, std::uint64_t count) {
    const std::string text = std::to_string(first);
    return count == 1 ? text : text + "-" + std::to_string(first + count - 1);
}

std::string describe(const MapRun& run) {
    std::string text = range(run.first, run.count) + ": ";
    if (isHole(run.entry)) return text + "hole\n";
    text += run.entry.mapped ? "mapped" : "unmapped";
    if (run.entry.vpushed) text += " vpushed";
    if (run.entry.vpulled) text += " vpulled";
    if (run.entry.synced) text += " synced";
    text += ", pool " + std::to_string(run.entry.poolNumber);
    return text + (run.count == 1 ? ", extent " : ", extents ") + range(run.entry.extentAddress, run.count) + "\n";
}

void printRun(const MapOptions& options, const MapRun& run) {
    if (!options.json) {
        print(describe(run));
        return;
    }
    Json object = fileObject(options.file);
    object["first"] = run.first;
    object["count"] = run.count;
    if (isHole(run.entry)) {
        object["hole"] = true;
    } else {
        addMembers(object, run.entry);
    }
    printJson(object);
}

void printSummary(const MapOptions& options, const MapSummary& summary) {
    if (!options.json) {
        print(std::to_string(summary.entries) + " entries: " + std::to_string(summary.mapped) + " mapped, " +
              std::to_string(summary.synced) + " synced, " + std::to_string(summary.holes) + " holes, in " +
              std::to_string(summary.runs) + " runs\n");
        return;
    }
    Json object = fileObject(options.file);
    object["summary"] = true;
    object["entries"] = summary.entries;
    object["mapped"] = summary.mapped;
    object["synced"] = summary.synced;
    object["holes"] = summary.holes;
    object["runs"] = summary.runs;
    printJson(object);
}

/// Whether the map file ends where its entries would start.
bool isEmptyMap(const tool::ISCSIEPFileMAP& file) {
    std::error_code error;
    return file.head0Type == tool::EP_FILE_TYPE_MAP &&
           std::filesystem::file_size(file.path, error) == file.head0DataStartOffset && !error;
}

void run(const MapOptions& options, Session& session) {
    const std::optional<std::string> path = session.openablePath(options.file);
    if (!path) return;
    tool::ISCSIEPFileMAP file(*path);
    if (!session.succeeded(file.parseHead0(), options.file)) return;
    MapSummary summary;
    MapRun current;
    MapChart chart(options.first);
    const auto visit = [&](std::uint64_t index, const tool::ISCSIEPMapEntryInfo& entry) {
        summary.add(entry);
        if (current.count > 0 && current.continuesWith(entry)) {
            ++current.count;
        } else {
            if (current.count > 0 && !options.chart) printRun(options, current);
            current = {index, 1, entry};
            ++summary.runs;
        }
        if (options.chart) chart.add(entry.mapped);
    };
    const auto count = options.first == 0 && isEmptyMap(file) ? 0 : options.count;
    const int error = walkMap(file, options.first, count, visit);
    if (current.count > 0 && !options.chart) printRun(options, current);
    if (!session.succeeded(error, options.file + ": entry " + std::to_string(options.first + summary.entries))) return;
    if (options.chart) print(chart.draw(terminalWidth(), localeIsUnicode()));
    printSummary(options, summary);
}

}  // namespace

void addMap(CLI::App& app, Session& session) {
    const auto options = std::make_shared<MapOptions>();
    CLI::App* command = app.add_subcommand("map", "Show all entries of a map file, merged into runs");
    command->add_option("MAPFILE", options->file, "Map file of a LUN")->required()->type_name("");
    addParsed(command, "--first", "Index to start at", options->first, parseNumber);
    addParsed(command, "--count", "Entries to show at most", options->count, parseNumber);
    CLI::Option* json = command->add_flag("--json", options->json, "One JSON object a run, then one that sums up");
    command->add_flag("--chart", options->chart, "A picture instead of the runs")->excludes(json);
    command->callback([options, &session] { run(*options, session); });
}

}  // namespace epinspect
