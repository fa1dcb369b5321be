// epinspect owner: whose bytes lie at positions of a data file.
#include <etc/ISCSIEPDiagnostics.h>

#include <memory>

#include "commands/Commands.h"
#include "commands/MapArguments.h"
#include "commands/MapOutput.h"
#include "commands/PlaceOptions.h"
#include "frame/Json.h"
#include "frame/Numbers.h"
#include "frame/Output.h"
#include "store/FileNames.h"
#include "store/Owners.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

struct OwnerOptions {
    std::string file;
    std::vector<Range> positions;
    VolumesChoice volumes;
    PlaceChoice choice;
};

/// The data file that was asked about, and its number on its volume.
struct AskedFile {
    const std::string& name;  ///< as typed
    const DataFile& data;
    const Owners& owners;

    std::uint64_t start() const { return data.file->head0DataStartOffset; }
};

/// What an owner has from the first to the last position of a part.
struct OwnedBytes {
    std::uint64_t lastIndex;                 ///< of its entries
    std::uint64_t remainder;                 ///< of the first position in its extent
    std::optional<std::uint64_t> lunOffset;  ///< of the first position; nothing from 2^63 on

    OwnedBytes(const OwnedRange& part, const Owner& owner, std::uint64_t dataStart) {
        const std::uint32_t extentSize = *owner.map->extentSize;
        const std::uint64_t inExtents = part.position - dataStart - owner.start;
        lastIndex = owner.index + (inExtents + part.length - 1) / extentSize;
        remainder = inExtents % extentSize;
        lunOffset = positionOf(0, owner.index, extentSize, static_cast<std::uint32_t>(remainder));
    }
};

const char* nameOf(OwnedRange::Where where) {
    switch (where) {
        case OwnedRange::Where::header:
            return "header";
        case OwnedRange::Where::extent:
            return "extent";
        case OwnedRange::Where::pastEnd:
            return "past-end";
    }
    return "";
}

void writePart(const AskedFile& asked, const OwnedRange& part) {
    Json json(asked.name);
    json.begin("position").number("position", part.position).number("length", part.length);
    json.text("where", nameOf(part.where)).beginList("owners");
    for (const Owner& owner : part.owners) {
        const StoreFile& file = owner.map->file;
        const OwnedBytes bytes(part, owner, asked.start());
        json.beginObject().text("countFrom", owner.countFrom == CountFrom::file ? "file" : "volume");
        json.path("map", file.path);
        json.lids(lidsOf(file.luns));
        json.number("index", owner.index).number("remainder", bytes.remainder);
        if (bytes.lunOffset) {
            json.number("lunOffset", *bytes.lunOffset);
        } else {
            json.null("lunOffset");
        }
        writeMembers(json, owner.entry);
        json.boolean("undecided", owner.undecided).endObject();
    }
    json.endList();
    if (!asked.owners.isComplete()) json.boolean("incomplete", true);
    json.end();
}

void writeOwner(LineBuffer& text, const AskedFile& asked, const OwnedRange& part, const Owner& owner) {
    const StoreFile& file = owner.map->file;
    const OwnedBytes bytes(part, owner, asked.start());
    const std::uint64_t entries = bytes.lastIndex - owner.index + 1;
    text.add(file.luns.empty() ? forReader(file.path) : lunsText(lidsOf(file.luns)),
             part.length == 1 ? " byte " : " bytes ");
    if (bytes.lunOffset) {
        writeRange(text, *bytes.lunOffset, part.length);
    } else {
        text.add("past 2^63");
    }
    writeRange(text.add(entries == 1 ? ": entry " : ": entries "), owner.index, entries);
    text.add(part.length == 1 ? ", byte " : ", from byte ").decimal(bytes.remainder);
    text.add(entries == 1 ? " of its extent" : " of the first extent");
    writeEntries(text.add(": "), owner.entry, entries);
    if (!owner.undecided) return;
    text.add(owner.countFrom == CountFrom::file ? ", if extents are counted within the data file"
                                                : ", if extents are counted from the volume's start");
}

void printPart(const AskedFile& asked, const OwnedRange& part) {
    LineBuffer text;
    const auto begin = [&] {
        writeRange(text, part.position, part.length);
        text.add(": ");
    };
    for (const Owner& owner : part.owners) {
        begin();
        writeOwner(text, asked, part, owner);
        text.add("\n");
    }
    if (part.owners.empty() && part.where != OwnedRange::Where::pastEnd) {  // which is a failure
        begin();
        const char* nobody = asked.owners.isComplete() ? "no map uses this\n" : "no map that could be read uses this\n";
        text.add(part.where == OwnedRange::Where::header ? "header block, before the first extent\n" : nobody);
    }
    print(text.view());
}

void showPart(Session& session, const AskedFile& asked, const OwnedRange& part) {
    if (session.json) {
        writePart(asked, part);
    } else {
        printPart(asked, part);
    }
    if (part.where != OwnedRange::Where::pastEnd) return;
    session.fail({asked.name, "position " + std::to_string(part.position)},
                 "past the end, the file holds " + std::to_string(asked.data.size) + " bytes",
                 tool::EP_ERR_READ_FAILED);
}

/// What the answers rest on.
void printAssumptions(const OwnerOptions& options, std::uint64_t number, bool undecided) {
    std::string text = "assumed: entry i holds bytes from i x extent size";
    if (options.choice.countFrom) {
        text += *options.choice.countFrom == CountFrom::file
                    ? "; extents counted within the data file, as --count-from says"
                    : "; extents counted from the volume's start, as --count-from says";
    } else if (number > 0) {
        text += undecided
                    ? "; ambiguous: by both ways of counting extents lie inside the data file, --count-from decides"
                    : "; extents counted within the data file (counted from the volume's start they would lie "
                      "past its end)";
    }
    print(text + "\n");
}

/// The number of the data file, when it is one of its volume that can be read; reports what is wrong with it.
std::optional<std::uint64_t> numberOf(Session& session, const OwnerOptions& options, const std::string& targetPath) {
    const auto number = dataFileNumberIn(targetPath);
    if (options.volumes.number == std::uint32_t{0}) {
        session.fail({options.file, ""}, "its path names no volume", tool::EP_ERR_NO_PATH);
    } else if (!number || isMisnamed(targetPath)) {
        session.fail({options.file, ""}, "not a name that the target gives to a data file", tool::EP_ERR_NO_PATH);
    } else {
        return number;
    }
    return std::nullopt;
}

void run(OwnerOptions& options, Session& session) {
    const auto path = session.openablePath(options.file, NamedBy::user);
    if (!path) return;
    const std::string targetPath = session.root.targetPath(options.file);
    options.volumes.number = volumeOf(session, targetPath);
    const auto number = numberOf(session, options, targetPath);
    if (!number) return;
    DataFiles files(session, targetPath, true);
    const DataFile& data = files.at(*number);
    if (data.failure) return session.failed(*data.failure);
    if (identityOf(*path) != identityOf(session.root.locate(data.path).hostPath)) {
        return session.fail({options.file, ""}, "not the data file of its volume, which is " + data.path,
                            tool::EP_ERR_NO_PATH);
    }
    const Volumes volumes(session, options.volumes);
    const Volume none;
    const Volume* volume = volumes.find(*options.volumes.number);
    Owners owners(session, volume != nullptr ? *volume : none, data, *number, options.choice);
    if (!owners.find(options.positions)) return;
    const AskedFile asked = {options.file, data, owners};
    bool undecided = false;
    for (const Range& positions : options.positions) {
        owners.forEachPart(positions, [&](const OwnedRange& part) {
            for (const Owner& owner : part.owners) undecided = undecided || owner.undecided;
            showPart(session, asked, part);
        });
    }
    files.noticeChanges();
    if (!session.json) printAssumptions(options, *number, undecided);
}

}  // namespace

void addOwner(Command& parent, Session& session) {
    const auto options = std::make_shared<OwnerOptions>();
    options->volumes.sizeOfAll = true;
    Command& command = parent.add("owner", "Show whose bytes lie at positions of a data file");
    command.argument("DATFILE", "Data file of a volume", options->file);
    command.arguments("POSITION", "Byte of the data file, or FIRST-LAST; K, M, G, T or KiB, MiB, GiB, TiB may follow",
                      options->positions, parsePositions);
    addPlaceOptions(command, options->volumes.extentSize, options->choice);
    addLunsOption(command, options->volumes.lids);
    command
        .flag("--json", "One JSON object per position, or per part of a range that has the same owners", session.json)
        .action([options, &session] { run(*options, session); });
}

}  // namespace epinspect
