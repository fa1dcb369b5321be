#include "check/MapRules.h"

#include <algorithm>

#include "Output.h"

namespace epinspect {

namespace {

constexpr std::uint64_t entrySize = 8;
constexpr std::uint32_t mostPools = 1024;

/// The entries of `run` from the one that is `skipped` behind the first on.
MapRun partOf(const MapRun& run, std::uint64_t skipped, std::uint64_t count) {
    MapRun part = {run.first + skipped, count, run.entry};
    part.entry.extentAddress += skipped;
    return part;
}

/// All that is stored in an entry.
std::uint64_t bitsOf(const MapEntry& entry) {
    const auto bit = [](bool flag, unsigned int number) { return std::uint64_t{flag ? 1U : 0U} << number; };
    return bit(entry.mapped, 63) | bit(entry.vpushed, 62) | bit(entry.vpulled, 61) | bit(entry.synced, 60) |
           lowBitsOf(entry);
}

/// The entries need not be one run.
std::string firstExtentText(const MapRun& entries) {
    return extentsText(entries.entry.extentAddress, 1) + (entries.count == 1 ? "" : " in the first");
}

}  // namespace

void MapRules::useDataFiles(VolumeData& dataFiles, std::uint32_t extentSize) {
    dataFiles_ = &dataFiles;
    extentSize_ = extentSize;
}

void MapRules::add(const MapRun& run) {
    summary_.add(run);
    if (isHole(run.entry)) return;
    checkUnmappedBits(run);
    checkAddressBits(run);
    if (run.entry.mapped && dataFiles_ != nullptr) checkDataFiles(run);
}

void MapRules::finish(bool complete) {
    for (Stretch* stretch : {&unmappedBits_, &addressBits_, &missingDataFile_, &beyondDataFile_}) end(*stretch);
    report_.countEntries(summary_.entries);
    checkPoolCount();
    checkPartialEntry();
    if (complete) {
        checkTotalCount();
        checkMappedCount();
        checkSyncCount();
    } else {
        report_.notCompared("total-count, mapped-count, sync-count: not all entries could be read", file_.path);
    }
    if (openBits_) {
        report_.notCompared("missing-data-file, beyond-data-file: entries with bits 48 to 51 set", file_.path);
    }
    if (unreadableFiles_) report_.notCompared("beyond-data-file: a data file cannot be read", file_.path);
}

void MapRules::take(Stretch& stretch, const MapRun& part) {
    if (stretch.entries.count > 0 && stretch.entries.first + stretch.entries.count == part.first) {
        stretch.entries.count += part.count;
    } else {
        end(stretch);
        stretch.entries = part;
    }
}

void MapRules::end(Stretch& stretch) {
    if (stretch.entries.count > 0) (this->*stretch.tell)(stretch.entries);
}

void MapRules::addFinding(const char* rule, const MapRun& entries, const Value& stored, const Value& found,
                          const std::string& message) const {
    report_.add({file_.path, rule, stored, found, entriesText(entries.first, entries.count) + ": " + message,
                 Finding::Entries{&file_.path, entries.first, entries.count}});
}

void MapRules::checkCount(const char* rule, std::uint64_t stored, std::uint64_t found, const char* what) const {
    if (stored == found) return;
    report_.add({file_.path, rule, Value::number(stored), Value::number(found),
                 std::to_string(stored) + " stored, " + std::to_string(found) + what});
}

void MapRules::checkTotalCount() const {
    checkCount("total-count", content_.totalCount, summary_.entries, " entries found");
}

void MapRules::checkMappedCount() const {
    checkCount("mapped-count", content_.mappedCount, summary_.mapped, " mapped entries found");
}

void MapRules::checkSyncCount() const {
    checkCount("sync-count", content_.syncCount, summary_.synced, " synced entries found");
}

void MapRules::checkPoolCount() const {
    if (content_.seg0PoolCount <= mostPools) return;
    report_.add(
        {file_.path, "pool-count", Value::number(content_.seg0PoolCount), Value::number(mostPools),
         std::to_string(content_.seg0PoolCount) + " stored, SEG[0] holds at most " + std::to_string(mostPools)});
}

void MapRules::checkPartialEntry() const {
    if (file_.size <= content_.head0DataStartOffset) return;
    const std::uint64_t bytes = file_.size - content_.head0DataStartOffset;
    const std::uint64_t rest = bytes % entrySize;
    if (rest == 0) return;
    report_.add({file_.path, "partial-entry", Value::number(file_.size), Value::number(rest),
                 "the file of " + std::to_string(file_.size) + " bytes ends inside entry " +
                     std::to_string(bytes / entrySize) + ", " + std::to_string(rest) + " of its " +
                     std::to_string(entrySize) + " bytes are there"});
}

void MapRules::checkUnmappedBits(const MapRun& run) {
    if (!run.entry.mapped) take(unmappedBits_, run);
}

void MapRules::tellUnmappedBits(const MapRun& entries) const {
    const Value stored = Value::hexadecimal(bitsOf(entries.entry));
    addFinding("unmapped-bits", entries, stored, Value::hexadecimal(0),
               "unmapped, but " + std::string(entries.count == 1 ? "" : "the first ") + "holds " + stored.shown());
}

void MapRules::checkAddressBits(const MapRun& run) {
    if (hasOpenBits(run.entry)) take(addressBits_, run);
}

void MapRules::tellAddressBits(const MapRun& entries) const {
    const Value stored = Value::hexadecimal(bitsOf(entries.entry));
    const Value found = Value::hexadecimal(entries.entry.poolNumber & 0xFU);
    addFinding("address-bits", entries, stored, found,
               stored.shown() + (entries.count == 1 ? "" : " in the first") + ", of which bits 48 to 51 are " +
                   found.shown() + ": they count in extent address and pool number");
}

void MapRules::checkDataFiles(const MapRun& run) {
    if (hasOpenBits(run.entry)) {
        openBits_ = true;
        return;
    }
    for (std::uint64_t done = 0; done < run.count;) {
        const std::uint64_t address = run.entry.extentAddress + done;
        const auto place = placeOf(address, extentSize_);
        if (!place) return take(missingDataFile_, partOf(run, done, run.count - done));
        const std::uint64_t count = std::min(run.count - done, place->next - address);
        checkDataFile(partOf(run, done, count), *place);
        done += count;
    }
}

/// Compares entries whose extents start in one data file, the first one at `place`. Counted from the volume's start an
/// extent lies further on than counted within the data file: beyond the end by that reading, it is so by both.
void MapRules::checkDataFile(const MapRun& part, const ExtentPlace& place) {
    std::uint64_t bytes = 0;
    const VolumeData::State state = dataFiles_->find(place.dataFile, bytes);
    if (state == VolumeData::State::missing) return take(missingDataFile_, part);
    if (state == VolumeData::State::unreadable) {
        unreadableFiles_ = true;
        return;
    }
    const std::uint64_t held = bytes / extentSize_;
    const std::uint64_t inside = held > place.inFile ? std::min(part.count, held - place.inFile) : 0;
    if (inside < part.count) take(beyondDataFile_, partOf(part, inside, part.count - inside));
}

void MapRules::tellMissingDataFile(const MapRun& entries) const {
    const std::uint64_t address = entries.entry.extentAddress;
    const auto place = placeOf(address, extentSize_);
    const std::string found = "no " + (place ? VolumeData::nameOf(place->dataFile) : "data file");
    addFinding("missing-data-file", entries, Value::number(address), Value::text(found),
               firstExtentText(entries) + ", for which there is " + found);
}

void MapRules::tellBeyondDataFile(const MapRun& entries) const {
    const std::uint64_t address = entries.entry.extentAddress;
    const std::uint64_t number = placeOf(address, extentSize_)->dataFile;
    std::uint64_t bytes = 0;
    dataFiles_->find(number, bytes);
    addFinding("beyond-data-file", entries, Value::number(address), Value::number(bytes / extentSize_),
               firstExtentText(entries) + ", behind the end of " + VolumeData::nameOf(number) + ", which holds " +
                   counted(bytes / extentSize_, "extent", "extents"));
}

}  // namespace epinspect
