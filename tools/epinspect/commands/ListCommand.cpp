// epinspect list: what lies in the store.
#include <ISCSIEPFileMAP.h>

#include <algorithm>
#include <memory>

#include "commands/Commands.h"
#include "commands/MapArguments.h"
#include "commands/MapOutput.h"
#include "frame/Json.h"
#include "frame/Output.h"
#include "store/Doubts.h"
#include "store/Store.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

/// How many entries the map file `file` holds; nothing for other files, and after a failure, which is reported.
std::optional<std::uint64_t> entriesOf(Session& session, const StoreFile& file) {
    if (file.missing || file.kind->type != tool::EP_FILE_TYPE_MAP) return std::nullopt;
    tool::ISCSIEPFileMAP map(file.hostPath);
    if (!session.succeeded(map.parseHead0(), {file.path, ""})) return std::nullopt;
    remarkOnKind(session, map, file.path, file.kind);
    if (map.head0Type != tool::EP_FILE_TYPE_MAP) return std::nullopt;
    remarkOnDataStart(session, map, file.path);
    remarkOnPartialEntry(session, map, file.path);
    unsigned long long entries = 0;
    if (!session.succeeded(map.getEntryCount(entries), {file.path, ""})) return std::nullopt;
    return entries;
}

/// What is known of a file, then its path, then what else it is: a link, a second name. One line where that fits.
void printFile(const StoreFile& file, const std::optional<std::uint64_t>& entries) {
    constexpr std::size_t sizeColumns = 14;
    constexpr unsigned int indent = 6;
    const std::string size = file.missing ? "missing" : std::to_string(file.size);
    std::vector<std::string> pieces = {file.kind->name +
                                       std::string(sizeColumns - std::min(sizeColumns - 1, size.size()), ' ') + size};
    if (file.misnamed) pieces.emplace_back("no data file of the target");
    if (!file.luns.empty()) pieces.push_back(lunsText(lidsOf(file.luns)));
    if (entries) pieces.push_back(counted(*entries, "entry", "entries"));
    if (file.mapName) {
        const std::string& name = file.mapName->name;
        pieces.push_back(file.mapName->typeName + " " + file.mapName->uuid + (name.empty() ? "" : " ") + name);
    }
    pieces.push_back(file.path);
    if (file.link) pieces.push_back("link to " + *file.link);
    if (!file.sameAs.empty()) pieces.push_back("same file as " + file.sameAs);
    for (std::string& piece : pieces) piece = forReader(piece);
    print(wrapped({pieces.begin(), pieces.end()}, outputWidth(), indent, "  "));
}

void writeFile(const StoreFile& file, const std::optional<std::uint64_t>& entries) {
    Json json(file.path, lidsOf(file.luns));
    json.begin("file").text("fileKind", file.kind->name);
    if (file.missing) {
        json.null("size");
    } else {
        json.number("size", file.size);
    }
    json.boolean("missing", file.missing);
    if (entries) json.number("entries", *entries);
    if (file.mapName) {
        json.text("typeName", file.mapName->typeName).text("uuid", file.mapName->uuid).text("name", file.mapName->name);
    }
    if (file.misnamed) json.boolean("misnamed", true);
    if (file.link) json.path("link", *file.link);
    if (!file.sameAs.empty()) json.path("sameAs", file.sameAs);
    json.end();
}

void run(Session& session, const Lids& lids) {
    session.remarkOnCollection();
    Store store(session, lids);
    bool any = false;
    store.forEachFile([&](const StoreFile& file) {
        any = true;
        const auto entries = entriesOf(session, file);
        if (session.json) {
            writeFile(file, entries);
        } else {
            printFile(file, entries);
        }
    });
    if (!any) failEmptyStore(session);
}

}  // namespace

void addList(Command& parent, Session& session) {
    const auto lids = std::make_shared<Lids>(usualLids);
    Command& command = parent.add("list", "Show the files of the store, and which files of LUNs are missing");
    addLunsOption(command, *lids);
    command.flag("--json", "One JSON object per file", session.json).action([lids, &session] { run(session, *lids); });
}

}  // namespace epinspect
