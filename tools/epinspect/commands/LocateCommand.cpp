// epinspect locate: where bytes of a LUN lie.
#include <memory>
#include <vector>

#include "commands/Commands.h"
#include "commands/MapArguments.h"
#include "commands/MapOutput.h"
#include "commands/PlaceOptions.h"
#include "frame/Json.h"
#include "frame/Numbers.h"
#include "frame/Output.h"
#include "map/MapWalk.h"
#include "store/DataFiles.h"
#include "store/LunMap.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

struct LocateOptions {
    PlaceOptions place;
    std::vector<std::uint64_t> offsets;
};

/// Where a byte lies if extents are counted in one of the two ways.
struct Candidate {
    CountFrom countFrom;
    std::uint64_t extent;
    std::optional<std::uint64_t> position;  ///< nothing when the data file cannot be read, or no file reaches so far
    bool inside;
};

/// A byte of the LUN, and what is found of it step by step.
struct Byte {
    std::uint64_t offset;
    std::uint64_t index;      ///< of its entry
    std::uint32_t remainder;  ///< in its extent
    MapEntry entry;
    std::string dataFile = {};
    std::vector<Candidate> candidates = {};
    std::vector<std::string> assumed = {"entry i holds bytes from i x extent size"};
};

std::string partOf(const Byte& byte) { return "byte " + std::to_string(byte.offset); }

/// By both ways of counting, or by the one that was chosen.
std::vector<Candidate> candidatesIn(const DataFile& data, const ExtentPlace& place, const LunMap& lun,
                                    std::uint32_t remainder, const std::optional<CountFrom>& countFrom) {
    std::vector<Candidate> candidates;
    for (const CountFrom way : {CountFrom::file, CountFrom::volume}) {
        if (countFrom.value_or(way) != way) continue;
        const std::uint64_t extent = place.counted(way);
        const auto inData = positionOf(0, extent, lun.extentSize, remainder);
        Candidate candidate = {way, extent, std::nullopt, inData && *inData < data.dataSize};
        if (data.file != nullptr) {
            candidate.position = positionOf(data.file->head0DataStartOffset, extent, lun.extentSize, remainder);
        }
        candidates.push_back(candidate);
    }
    return candidates;
}

/// Writes down why extents are counted in this way.
void settleCounting(Byte& byte, const PlaceChoice& choice, const std::optional<CountFrom>& counting) {
    if (choice.countFrom) {
        byte.assumed.emplace_back(*choice.countFrom == CountFrom::file
                                      ? "extents counted within the data file, as --count-from says"
                                      : "extents counted from the volume's start, as --count-from says");
        return;
    }
    const Candidate& inFile = byte.candidates[0];
    const Candidate& inVolume = byte.candidates[1];
    if (inFile.extent == inVolume.extent || !inFile.inside) return;
    byte.assumed.emplace_back(
        !counting
            ? "ambiguous: both places lie inside the data file, --count-from decides"
            : "extents counted within the data file (counted from the volume's start they would lie past its end)");
}

/// Finds the candidates for a byte whose entry is mapped. Reports why there is none, or none that can be read.
void findCandidates(const PlaceChoice& choice, Session& session, const LunMap& lun, DataFiles& files, Byte& byte) {
    const Subject subject = lun.subject(partOf(byte));
    const auto address = extentAddressOf(byte.entry, choice);
    if (!address) return session.fail(subject, ambiguousAddressText(byte.entry), tool::EP_ERR_NO_PATH);
    if (isAmbiguous(byte.entry)) {
        byte.assumed.push_back("extent " + std::to_string(*address) + ", as --address-bits says");
    }
    const auto place = placeOf(*address, lun.extentSize);
    if (!place) {
        session.failed({subject, tool::EP_ERR_SEEK_FAILED, 0, {}});
        return;
    }
    const DataFile& data = files.at(place->dataFile);
    const Subject inData = {data.path.empty() ? lun.file : data.path, subject.part};
    if (data.failure) session.failed({inData, data.failure->error, data.failure->reason, data.failure->what});
    if (data.path.empty()) return;
    byte.dataFile = data.path;
    byte.candidates = candidatesIn(data, *place, lun, byte.remainder, choice.countFrom);
    settleCounting(byte, choice, countingOf(*place, lun.extentSize, byte.remainder, data.dataSize, choice));
    if (!data.failure && !byte.candidates[0].inside) {
        session.fail(inData, "past the end, the file holds " + std::to_string(data.dataSize) + " bytes of extents",
                     tool::EP_ERR_READ_FAILED);
    }
}

void writePlace(const LunMap& lun, const Byte& byte) {
    Json json(lun.file, lun.lids);
    json.begin("place")
        .number("lunOffset", byte.offset)
        .number("index", byte.index)
        .number("remainder", byte.remainder)
        .number("entryOffset", entryOffset(*lun.map, byte.index));
    writeMembers(json, byte.entry);
    json.beginList("candidates");
    for (const Candidate& candidate : byte.candidates) {
        json.beginObject()
            .text("countFrom", candidate.countFrom == CountFrom::file ? "file" : "volume")
            .text("dataFile", byte.dataFile)
            .number("extent", candidate.extent);
        if (candidate.position) {
            json.number("position", *candidate.position);
        } else {
            json.null("position");
        }
        json.boolean("inside", candidate.inside).endObject();
    }
    json.endList().end();
}

/// The byte's entry, which is known whatever comes after.
void printEntry(const LunMap& lun, const Byte& byte) {
    LineBuffer text;
    const Subject subject = lun.subject(partOf(byte));
    text.add(forReader(subject.file), subject.file.empty() ? "" : " ", subject.part, ": entry ").decimal(byte.index);
    text.add(", byte ").decimal(byte.remainder).add(" of its extent\n");
    writeRun(text, {byte.index, 1, byte.entry});
    print(text.view());
}

void printPlaces(const Byte& byte) {
    std::vector<Candidate> shown = byte.candidates;
    if (shown.size() == 2) {
        const bool same = shown[0].extent == shown[1].extent;
        if (same || (shown[0].inside && !shown[1].inside)) shown.pop_back();
    }
    LineBuffer text;
    for (const Candidate& candidate : shown) {
        text.add(forReader(byte.dataFile), " position ");
        if (candidate.position) {
            text.decimal(*candidate.position);
        } else {
            text.add("unknown");
        }
        text.add(" (extent ").decimal(candidate.extent).add(" of the file");
        if (shown.size() == 2) {
            text.add(candidate.countFrom == CountFrom::file ? ", counted within it"
                                                            : ", counted from the volume's start");
        }
        text.add(!candidate.position || candidate.inside ? ")\n" : "), past its end\n");
    }
    const char* separator = "assumed: ";
    for (const std::string& assumption : byte.assumed) {
        text.add(separator, assumption);
        separator = "; ";
    }
    print(text.add("\n").view());
}

void locate(const PlaceChoice& choice, Session& session, const LunMap& lun, DataFiles& files, std::uint64_t offset) {
    Byte byte{offset, offset / lun.extentSize, static_cast<std::uint32_t>(offset % lun.extentSize), {}};
    if (offset >= lun.size) return session.failed(lun.pastEnd(partOf(byte)));
    if (byte.index >= lun.entries) return session.failed(lun.pastMap(partOf(byte)));
    const Subject inMap = {lun.file, lun.subject(partOf(byte)).part};
    if (!session.succeeded(lun.map->getMapEntry(byte.index, byte.entry), inMap)) return;
    if (!session.json) printEntry(lun, byte);
    if (byte.entry.mapped) {
        findCandidates(choice, session, lun, files, byte);
    } else {
        byte.assumed.emplace_back("what is not mapped reads as zeros");
    }
    if (session.json) {
        writePlace(lun, byte);
    } else {
        printPlaces(byte);
    }
}

void run(const LocateOptions& options, Session& session) {
    const std::optional<LunMap> lun = openLunMap(session, options.place.map, options.place.extentSize);
    if (!lun) return;
    DataFiles files(session, lun->targetPath, true);
    for (const std::uint64_t offset : options.offsets) locate(options.place.choice, session, *lun, files, offset);
}

}  // namespace

void addLocate(Command& parent, Session& session) {
    const auto options = std::make_shared<LocateOptions>();
    Command& command = parent.add("locate", "Show where bytes of a LUN lie");
    addMapArgument(command, options->place.map);
    command.arguments("OFFSET", "Offset of a byte in the LUN; K, M, G, T or KiB, MiB, GiB, TiB may follow",
                      options->offsets, parseSize);
    addPlaceOptions(command, options->place.extentSize, options->place.choice);
    command.flag("--json", "One JSON object per offset", session.json).action([options, &session] {
        run(*options, session);
    });
}

}  // namespace epinspect
