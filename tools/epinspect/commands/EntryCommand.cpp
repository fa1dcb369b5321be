// epinspect entry: the map entries of given indexes.
#include <CLI/App.hpp>
#include <memory>
#include <vector>

#include "Json.h"
#include "Numbers.h"
#include "Output.h"
#include "commands/Commands.h"
#include "map/MapWalk.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

struct EntryOptions {
    std::string file;
    std::vector<std::string> indexes;
    bool json = false;
};

void printEntry(const EntryOptions& options, std::uint64_t index, const tool::ISCSIEPMapEntryInfo& entry) {
    if (!options.json) {
        print(std::to_string(index) + ": " + entry.toString());
        return;
    }
    Json object = fileObject(options.file);
    object["index"] = index;
    addMembers(object, entry);
    printJson(object);
}

/// The entries of a range up to the first one that is not there.
void printRange(const EntryOptions& options, Session& session, tool::ISCSIEPFileMAP& file, IndexRange range) {
    std::uint64_t next = range.first;
    int error = walkMap(file, range.first, range.last - range.first, [&](std::uint64_t index, const auto& found) {
        printEntry(options, index, found);
        next = index + 1;
    });
    tool::ISCSIEPMapEntryInfo entry;  // the last one, or the first that the walk has not met
    if (error == 0) error = file.getMapEntry(next, entry);
    if (error == 0 && next != range.last) error = tool::EP_ERR_READ_FAILED;  // the file grows while it is read
    if (session.succeeded(error, options.file + ": entry " + std::to_string(next))) printEntry(options, next, entry);
}

void run(const EntryOptions& options, Session& session) {
    std::vector<IndexRange> ranges;
    for (const std::string& text : options.indexes) ranges.push_back(parseIndexRange(text));
    const std::optional<std::string> path = session.openablePath(options.file);
    if (!path) return;
    tool::ISCSIEPFileMAP file(*path);
    if (!session.succeeded(file.parseHead0(), options.file)) return;
    for (const IndexRange range : ranges) printRange(options, session, file, range);
}

}  // namespace

void addEntry(CLI::App& app, Session& session) {
    const auto options = std::make_shared<EntryOptions>();
    CLI::App* command = app.add_subcommand("entry", "Show entries of a map file");
    command->add_option("MAPFILE", options->file, "Map file of a LUN")->required()->type_name("");
    command->add_option("INDEX", options->indexes, "Index, or FIRST-LAST for all from FIRST to LAST")->required();
    command->add_flag("--json", options->json, "One JSON object an entry");
    command->callback([options, &session] { run(*options, session); });
}

}  // namespace epinspect
