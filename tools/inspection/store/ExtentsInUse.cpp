#include "store/ExtentsInUse.h"

#include <etc/ISCSIEPDiagnostics.h>
#include <etc/ISCSIEPFormat.h>

#include <algorithm>
#include <limits>
#include <new>
#include <utility>

#include "store/FileNames.h"
#include "store/OpenMap.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

/// The data files of a volume end before byte 2^63 of it.
constexpr std::uint64_t mostDataFiles = (std::uint64_t{1} << 63U) / tool::EP_DAT_FILE_SPAN;

}  // namespace

ExtentsInUse::ExtentsInUse(Context& context, const Volume& volume, std::optional<std::uint32_t> extentSize,
                           std::optional<AddressBits> addressBits)
    : context_(context),
      volume_(volume),
      extentSize_(extentSize),
      choice_{addressBits, {}},
      complete_(volume.complete),
      used_(memory_),
      shared_(memory_),
      asked_(memory_) {}

bool ExtentsInUse::count() {
    try {
        countMaps();
        countDataFiles();
        return true;
    } catch (const std::bad_alloc&) {
        context_.fail({volume_.folder, ""}, "out of memory for the extents in use", tool::EP_ERR_READ_FAILED);
        return false;
    }
}

void ExtentsInUse::countMaps() {
    for (const VolumeMap& map : volume_.maps) {
        allAsked_ = allAsked_ && map.asked;
        otherSizes_ = otherSizes_ || map.extentSize != extentSize_;
        if (map.extentSize == extentSize_) maps_.push_back({&map});
    }
    const std::uint64_t before = context_.failures();
    kept_.resize(maps_.size());
    for (std::size_t map = 0; map < maps_.size(); ++map) countMap(map);
    for (std::size_t map = 0; map < maps_.size(); ++map) {
        if (maps_[map].map->asked && maps_[map].read) maps_[map].shared = countShared(map);
    }
    kept_.clear();
    complete_ = complete_ && context_.failures() == before;
}

/// Counts all but what other maps share, who are not known yet.
void ExtentsInUse::countMap(std::size_t map) {
    constexpr std::uint64_t mostKept = std::uint64_t{48} << 20U;  // with what else is in memory
    MapUse& use = maps_[map];
    const StoreFile& file = use.map->file;
    const OpenedMap opened = openMap(context_, file.path, file.by);
    if (opened.file == nullptr) return;
    auto own = std::make_unique<ExtentSet>(memory_);
    ExtentAdder adder(*own, nullptr);
    use.read = walkAllRuns(context_, file.path, *opened.file, opened.entries, [&](const MapRun& run) {
        use.entries += run.count;
        if (!run.entry.mapped) return;
        use.mapped += run.count;
        if (isAmbiguous(run.entry) && !choice_.addressBits) use.ambiguous += run.count;
        addExtents(run, adder);
    });
    opened.watch->noticeChange();
    adder.finish();
    use.extents = own->size();
    used_.add(*own, &shared_);
    if (use.map->asked && !allAsked_) asked_.add(*own, nullptr);
    if (use.map->asked && memory_.taken() <= mostKept) kept_[map] = std::move(own);
    if (use.ambiguous == 0 || !use.map->asked) return;
    context_.remark(file.path, std::to_string(use.ambiguous) + " mapped " + (use.ambiguous == 1 ? "entry" : "entries") +
                                   " left out: bits 48 to 51 are set, --address-bits decides");
}

void ExtentsInUse::addExtents(const MapRun& run, ExtentAdder& adder) const {
    const auto address = extentAddressOf(run.entry, choice_);
    if (run.entry.mapped && address) adder.add(*address, run.count);
}

/// How many extents of a map others use too. Walks it again where its extents have not been kept.
std::uint64_t ExtentsInUse::countShared(std::size_t map) {
    const MapUse& use = maps_[map];
    if (shared_.size() == 0 || use.extents == 0) return 0;
    if (kept_[map] != nullptr) return shared_.countCommon(*kept_[map]);
    ExtentSet own(memory_);
    ExtentAdder adder(own, nullptr);
    walkAgain(context_, use.map->file.path, use.map->file.hostPath, [&](const MapRun& run) { addExtents(run, adder); });
    adder.finish();
    return std::min(shared_.countCommon(own), use.extents);
}

std::uint64_t ExtentsInUse::askedShared() const {
    if (allAsked_) return shared_.size();
    std::uint64_t shared = 0;
    shared_.forEach([&](std::uint64_t first, std::uint64_t count) {
        asked_.forEachIn(first, count, [&shared](std::uint64_t, std::uint64_t number) { shared += number; });
    });
    return shared;
}

void ExtentsInUse::countDataFiles() {
    const bool otherSizes = std::any_of(volume_.maps.begin(), volume_.maps.end(),
                                        [](const VolumeMap& map) { return map.extentSize.has_value(); });
    if (!extentSize_) {
        for (const StoreFile& file : volume_.dataFiles) {
            if (!otherSizes) dataFileUses_.push_back({file.path, {}});
        }
        return;
    }
    if (volume_.number == 0) return;
    Rows rows;
    DataFiles files(context_, volume_.folder + "/", false);
    for (const StoreFile& file : volume_.dataFiles) {
        const auto number = dataFileNumberIn(file.targetPath);
        if (number && !file.misnamed && *number < mostDataFiles) {
            rowAt(rows, files, *number);
        } else {
            context_.remark(file.path, "not a data file of the target, left out");
        }
    }
    used_.forEach([&](std::uint64_t first, std::uint64_t count) { addUse(rows, files, first, count, false); });
    shared_.forEach([&](std::uint64_t first, std::uint64_t count) { addUse(rows, files, first, count, true); });
    if (withoutPlace_ > 0) {
        context_.fail({volume_.folder, ""},
                      std::to_string(withoutPlace_) + " extents in use end past byte 2^63 of the volume",
                      tool::EP_ERR_SEEK_FAILED);
    }
    for (auto& [number, row] : rows) dataFileUses_.push_back(std::move(row));
}

/// The row of a data file, which is looked at when it comes up first.
DataFileUse& ExtentsInUse::rowAt(Rows& rows, DataFiles& files, std::uint64_t number) {
    const auto [row, added] = rows.try_emplace(number);
    DataFileUse& use = row->second;
    if (!added) return use;
    const DataFile& data = files.at(number);
    use.path = data.path;
    use.firstExtent = firstExtentOf(number, *extentSize_);
    if (data.failure) {
        context_.failed(*data.failure);
        return use;
    }
    use.extents = data.dataSize / *extentSize_;
    if (number > 0 && *use.extents > use.firstExtent) {
        context_.remark(use.path,
                        "larger than its part of the volume: extents may be counted from the volume's start, "
                        "these figures count within the file");
    }
    return use;
}

/// Adds extents of the volume to the data files that they start in.
void ExtentsInUse::addUse(Rows& rows, DataFiles& files, std::uint64_t first, std::uint64_t count, bool isShared) {
    while (count > 0) {
        const auto place = placeOf(first, *extentSize_);
        if (!place) {
            withoutPlace_ += isShared ? 0 : count;
            return;
        }
        const std::uint64_t part = std::min(count, place->next - first);
        DataFileUse& row = rowAt(rows, files, place->dataFile);
        const std::uint64_t held = row.extents.value_or(std::numeric_limits<std::uint64_t>::max());
        const std::uint64_t inside = held > place->inFile ? std::min(part, held - place->inFile) : 0;
        if (isShared) {
            row.shared += inside;
        } else {
            row.used += inside;
            row.beyond += part - inside;
        }
        first += part;
        count -= part;
    }
}

}  // namespace inspection
