// epinspect diff: what differs between two map files, entry by entry.
#include <cerrno>
#include <memory>

#include "commands/Commands.h"
#include "commands/MapOutput.h"
#include "frame/Json.h"
#include "frame/Output.h"
#include "map/MapDiff.h"
#include "map/MapWalk.h"
#include "store/OpenMap.h"

namespace epinspect {

namespace {

struct DiffOptions {
    std::vector<std::string> files;
};

/// What a difference is called in the listing and in JSON.
struct DifferenceName {
    const char* text;
    const char* json;
};

DifferenceName nameOf(Difference difference) {
    switch (difference) {
        case Difference::onlyFirst:
            return {"only in the first", "only-first"};
        case Difference::onlySecond:
            return {"only in the second", "only-second"};
        case Difference::moved:
            return {"moved", "moved"};
        default:
            return {"flags changed", "flags"};
    }
}

/// A side of a difference; of entries that are no run the first one, which the mark behind it says.
void writeSide(LineBuffer& line, const DiffRun::Side& side, std::uint64_t count) {
    writeEntries(line, *side.entry, side.isRun ? count : 1);
    if (!side.isRun) line.add(" ...");
}

void printRun(LineBuffer& line, const DiffRun& run) {
    line.clear();
    writeRange(line, run.first, run.count);
    line.add(": ", nameOf(run.difference).text, ": ");
    if (run.difference != Difference::onlySecond) writeSide(line, run.a, run.count);
    if (run.difference == Difference::moved || run.difference == Difference::flags) line.add(" -> ");
    if (run.difference != Difference::onlyFirst) writeSide(line, run.b, run.count);
    line.add("\n");
    print(line.view());
}

template <std::size_t keySize>
void writeSide(Json& json, const char (&name)[keySize], const DiffRun::Side& side) {
    if (!side.entry) {
        json.null(name);
        return;
    }
    writeMembers(json.beginObject(name), *side.entry);
    json.endObject();
}

void printRun(Json& json, const std::string& otherFile, const DiffRun& run) {
    json.begin("difference").path("otherFile", otherFile).number("first", run.first).number("count", run.count);
    json.text("difference", nameOf(run.difference).json);
    writeSide(json, "a", run.a);
    writeSide(json, "b", run.b);
    json.end();
}

void printSummary(const DiffSummary& summary) {
    const std::string entries = counted(summary.entries, "entry", "entries") + ": ";
    if (summary.same() == summary.entries) {
        print(entries + "no difference\n");
        return;
    }
    print(entries + std::to_string(summary.same()) + " same, " + std::to_string(summary.onlyFirst) +
          " only in the first, " + std::to_string(summary.onlySecond) + " only in the second, " +
          std::to_string(summary.moved) + " moved, " + std::to_string(summary.flags) + " with other flags\n");
}

void printSummary(Json& json, const std::string& otherFile, const DiffSummary& summary) {
    json.begin("summary")
        .path("otherFile", otherFile)
        .boolean("summary", true)
        .number("same", summary.same())
        .number("onlyFirst", summary.onlyFirst)
        .number("onlySecond", summary.onlySecond)
        .number("moved", summary.moved)
        .number("flags", summary.flags)
        .end();
}

/// Reads the entries of a map from `first` on, up to `wanted`, into `block`. Reports failures.
bool readBlock(Session& session, const std::string& name, const OpenedMap& map, std::uint64_t first,
               std::uint64_t wanted, std::vector<MapEntry>& block) {
    const auto count = std::min(wanted, map.entries - std::min(first, map.entries));
    const int error = map.file->getMapEntries(first, count, block);
    const int reason = errno;
    const auto failure = endOfRead(name, first + (error == 0 ? block.size() : 0), error, reason, block.size() == count);
    if (failure) session.failed(*failure);
    return !failure;
}

/// Compares both maps and gives runs of differences to each(run). Returns whether all entries could be read.
template <typename Each>
bool compareMaps(const DiffOptions& options, Session& session, const OpenedMap (&maps)[2], std::uint64_t entries,
                 Each&& each) {
    constexpr std::uint64_t blockSize = 4096;
    std::vector<MapEntry> a;
    std::vector<MapEntry> b;
    MapDiff diff;
    bool complete = true;
    for (std::uint64_t first = 0; first < entries && complete; first += blockSize) {
        session.progress("entries", first, entries);
        const auto wanted = std::min(entries - first, blockSize);
        complete = readBlock(session, options.files[0], maps[0], first, wanted, a) &&
                   readBlock(session, options.files[1], maps[1], first, wanted, b);
        if (complete) diff.add(first, a, b, each);
    }
    diff.finish(each);
    return complete;
}

void run(const DiffOptions& options, Session& session) {
    const OpenedMap maps[] = {openMap(session, options.files[0]), openMap(session, options.files[1])};
    if (!maps[0].file || !maps[1].file) return;
    DiffSummary summary;
    summary.entries = std::max(maps[0].entries, maps[1].entries);
    Json json(options.files[0]);
    LineBuffer line;
    const auto each = [&](const DiffRun& run) {
        session.differences = true;
        summary.add(run);
        if (session.json) {
            printRun(json, options.files[1], run);
        } else {
            printRun(line, run);
        }
    };
    if (!compareMaps(options, session, maps, summary.entries, each)) return;
    if (session.json) {
        printSummary(json, options.files[1], summary);
    } else {
        printSummary(summary);
    }
}

}  // namespace

void addDiff(Command& parent, Session& session) {
    const auto options = std::make_shared<DiffOptions>();
    options->files.resize(2);
    parent.add("diff", "Show what differs between two map files")
        .argument("MAPFILE", "Map file of a LUN", options->files[0])
        .argument("MAPFILE", "Map file to compare it with", options->files[1])
        .flag("--json", "One JSON object per run of differences, then a summary", session.json)
        .action([options, &session] { run(*options, session); });
}

}  // namespace epinspect
