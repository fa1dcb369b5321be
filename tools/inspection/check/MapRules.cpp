#include "check/MapRules.h"

#include <algorithm>
#include <limits>
#include <utility>

#include <etc/ISCSIEPFormat.h>

#include "store/FileNames.h"

namespace inspection {

namespace {

constexpr std::uint32_t mostPools = ISCSI::TOOL::EP_POOL_COUNT_MAX;

constexpr std::uint64_t noDataFile = std::numeric_limits<std::uint64_t>::max();  ///< larger than any number of one

/// `count` entries of `run`, from the one after the first `skipped` on.
MapRun partOf(const MapRun& run, std::uint64_t skipped, std::uint64_t count) {
    MapRun part = {run.first + skipped, count, run.entry};
    part.entry.extentAddress += skipped;
    return part;
}

}  // namespace

void MapRules::useDataFiles(DataFiles& dataFiles, std::uint32_t extentSize) {
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
    if (concernsDataFiles_) dataFiles_->noticeChanges();
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
    if (ambiguousBits_) {
        report_.notCompared("missing-data-file, beyond-data-file: entries with bits 48 to 51 set", file_.path);
    }
    if (!unreadable_.empty()) report_.notCompared("beyond-data-file: a data file cannot be read", file_.path);
}

void MapRules::take(Stretch& stretch, const MapRun& part, std::uint64_t dataFile) {
    MapRun& run = stretch.run;
    if (run.count > 0 && run.first + run.count == part.first && stretch.dataFile == dataFile) {
        run.count += part.count;
    } else {
        end(stretch);
        run = part;
        stretch.dataFile = dataFile;
    }
}

void MapRules::end(Stretch& stretch) {
    if (stretch.run.count > 0) (this->*stretch.report)(stretch);
}

Finding MapRules::findingOf(Rule rule, const Stretch& stretch, const Value& stored, const Value& found) const {
    Finding finding = {file_.path, rule, stored, found};
    finding.entries.emplace(stretch.run.first, stretch.run.count, stretch.run.entry);
    return finding;
}

/// Adds one about a data file, which may change as the map may.
void MapRules::addOfDataFile(Rule rule, const Stretch& stretch, const Value& found) {
    Finding finding = findingOf(rule, stretch, Value::number(stretch.run.entry.extentAddress), found);
    finding.dataFile = stretch.dataFile;
    if (stretch.dataFile != noDataFile) finding.dataFilePath = dataFiles_->at(stretch.dataFile).path;
    concernsDataFiles_ = true;
    report_.add(std::move(finding));
}

void MapRules::checkCount(Rule rule, std::uint64_t stored, std::uint64_t found) const {
    if (stored != found) report_.add({file_.path, rule, Value::number(stored), Value::number(found)});
}

void MapRules::checkTotalCount() const { checkCount(Rule::totalCount, content_.totalCount, summary_.entries); }

void MapRules::checkMappedCount() const { checkCount(Rule::mappedCount, content_.mappedCount, summary_.mapped); }

void MapRules::checkSyncCount() const { checkCount(Rule::syncCount, content_.syncCount, summary_.synced); }

void MapRules::checkPoolCount() const {
    if (content_.seg0PoolCount <= mostPools) return;
    report_.add({file_.path, Rule::poolCount, Value::number(content_.seg0PoolCount), Value::number(mostPools)});
}

void MapRules::checkPartialEntry() const {
    const auto partial = partialEntryOf(content_, file_.size);
    if (!partial) return;
    Finding finding = {file_.path, Rule::partialEntry, Value::number(file_.size), Value::number(partial->bytes)};
    finding.partial = partial;
    report_.add(finding);
}

void MapRules::checkUnmappedBits(const MapRun& run) {
    if (!run.entry.mapped) take(unmappedBits_, run);
}

void MapRules::reportUnmappedBits(const Stretch& stretch) {
    report_.add(
        findingOf(Rule::unmappedBits, stretch, Value::hexadecimal(bitsOf(stretch.run.entry)), Value::hexadecimal(0)));
}

void MapRules::checkAddressBits(const MapRun& run) {
    if (isAmbiguous(run.entry)) take(addressBits_, run);
}

void MapRules::reportAddressBits(const Stretch& stretch) {
    const MapEntry& entry = stretch.run.entry;
    report_.add(findingOf(Rule::addressBits, stretch, Value::hexadecimal(bitsOf(entry)),
                          Value::hexadecimal(ambiguousBitsOf(entry))));
}

void MapRules::checkDataFiles(const MapRun& run) {
    if (isAmbiguous(run.entry)) {
        ambiguousBits_ = true;
        return;
    }
    for (std::uint64_t done = 0; done < run.count;) {
        const std::uint64_t address = run.entry.extentAddress + done;
        const auto place = placeOf(address, extentSize_);
        if (!place) return take(missingDataFile_, partOf(run, done, run.count - done), noDataFile);
        const std::uint64_t count = std::min(run.count - done, place->next - address);
        checkDataFile(partOf(run, done, count), *place);
        done += count;
    }
}

/// Compares entries whose extents start in one data file, the first one at `place`. Counted from the volume's start, an
/// extent never lies before its place counted within the data file: if that one is past the end, both are.
void MapRules::checkDataFile(const MapRun& part, const ExtentPlace& place) {
    const DataFile& data = dataFiles_->at(place.dataFile);
    if (data.missing) return take(missingDataFile_, part, place.dataFile);
    if (data.failure) {
        unreadable_.emplace(place.dataFile, *data.failure);
        return;
    }
    const std::uint64_t held = data.dataSize / extentSize_;
    const std::uint64_t inside = held > place.inFile ? std::min(part.count, held - place.inFile) : 0;
    if (inside < part.count) {
        take(beyondDataFile_, partOf(part, inside, part.count - inside), place.dataFile);
    }
}

void MapRules::reportMissingDataFile(const Stretch& stretch) {
    const std::string name = stretch.dataFile == noDataFile ? "data file" : dataFileName(stretch.dataFile);
    addOfDataFile(Rule::missingDataFile, stretch, Value::text("no " + name));
}

void MapRules::reportBeyondDataFile(const Stretch& stretch) {
    const std::uint64_t held = dataFiles_->at(stretch.dataFile).dataSize / extentSize_;
    addOfDataFile(Rule::beyondDataFile, stretch, Value::number(held));
}

}  // namespace inspection
