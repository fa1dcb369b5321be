#include "check/StoreCheck.h"

#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileTBL.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <iterator>
#include <system_error>

#include "check/DataRules.h"
#include "store/ChangeWatch.h"
#include "store/FileSize.h"
#include "store/OpenMap.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

/// Whether a link lies at `hostPath`, wherever it leads.
bool isLink(const std::string& hostPath) {
    std::error_code error;
    return std::filesystem::is_symlink(std::filesystem::symlink_status(hostPath, error));
}

/// The path of the table file of the volume on which the file at `path` of the target lies. False when it names none.
bool findTable(Context& context, const std::string& path, std::string& table) {
    const Trial trial(context);
    return tool::ISCSIEPFile(path).getTBLFilePath(table) == 0;
}

}  // namespace

void StoreCheck::run() {
    if (!files_.areNamed() && files_.luns().empty()) {
        report_.notCompared("lun-size, extent-size, missing-map, missing-file: no LUN with " + idsText(options_.lids) +
                            " is known");
    }
    files_.forEach([this](const StoreFile& file) {
        checkFile(file);
        report_.handOut();
    });
    if (!files_.areNamed() && !anyFile_) failEmptyStore(context_);
    commonValues_.check(report_);
    checkKinds();
    checkExtentSizes();
    checkSameMaps();
    checkSharedExtents();
    report_.handOut();
}

void StoreCheck::checkFile(const StoreFile& file) {
    checked_.insert(file.targetPath);
    const ChangeWatch watch(context_, file.path, file.hostPath);
    report_.beginFile(file.path, file.lun() != nullptr ? std::optional(file.lun()->record.lid) : std::nullopt, watch);
    if (file.luns.size() > 1) sameMaps_.push_back(file);
    if (file.missing) return checkMissing(file);
    anyFile_ = true;
    const FileKind* kind = file.kind != nullptr ? file.kind : &headKind;
    auto content = kind->make(file.hostPath);
    if (!context_.succeeded(kind->parse(*content), {file.path, ""})) return;
    const FileKind* byType = kindByType(content->head0Type);
    if (file.kind == nullptr && byType != nullptr) {
        kind = byType;
        content = kind->make(file.hostPath);
        if (!context_.succeeded(kind->parse(*content), {file.path, ""})) return;
    }
    report_.countFile();
    commonValues_.add(file, *content);
    kindTypes_.add(file, *content);
    checkDataStart(file, *content, report_);
    checkContent(file, *kind, *content, checkKind(file, *content, report_));
    if (kind->type == tool::EP_FILE_TYPE_MAP) watch.noticeChange();
}

void StoreCheck::checkMissing(const StoreFile& file) {
    const MissingFile missing = missingAt(file.path, file.hostPath);
    if (file.lun() != nullptr) {
        checkMissingMap(missing, report_);
    } else if (file.kind->type == tool::EP_FILE_TYPE_DAT) {
        checkMissingDataFile(missing, report_);
    } else {
        checkMissingFile(missing, report_);
    }
}

/// What is missing at `path` of the target, and which LUNs should have it.
MissingFile StoreCheck::missingAt(const std::string& path, const std::string& hostPath) const {
    MissingFile missing = {path, isLink(hostPath), {}};
    const Trial trial(context_);
    for (const Lun& lun : files_.luns()) {
        const tool::ISCSIEPFile map(context_.root.plainPath(lun.mapPath));
        std::string table;
        std::string freeIndex;
        std::string journal;
        map.getTBLFilePath(table);
        map.getFRIFilePath(freeIndex);
        map.getJNLFilePath(journal);
        const std::string needed[] = {map.path, table, freeIndex, journal};
        if (std::find(std::begin(needed), std::end(needed), path) != std::end(needed)) missing.luns.push_back(&lun);
    }
    return missing;
}

void StoreCheck::checkContent(const StoreFile& file, const FileKind& kind, tool::ISCSIEPFile& content, bool isKind) {
    auto* const map = dynamic_cast<tool::ISCSIEPFileMAP*>(&content);
    const auto* const data = dynamic_cast<const tool::ISCSIEPFileDAT*>(&content);
    const auto* const table = dynamic_cast<const tool::ISCSIEPFileTBL*>(&content);
    if (map == nullptr && data == nullptr && table == nullptr) return;  // nothing but HEAD[0] is compared
    if (!isKind) {
        report_.notCompared(std::string("all other rules for a ") + kind.title + ": the type is another", file.path);
    } else if (map != nullptr) {
        checkMap(file, *map);
    } else if (data != nullptr) {
        checkSerialNumber(file, *data, report_);
    } else {
        tables_[file.targetPath] = table->extentSize;
    }
}

void StoreCheck::checkMap(const StoreFile& file, tool::ISCSIEPFileMAP& content) {
    for (const Lun* lun : file.luns) checkLunSize(file, content, *lun, report_);
    if (file.luns.empty() && (files_.areNamed() || !files_.luns().empty())) {
        report_.notCompared("lun-size, extent-size: no LUN with " + idsText(options_.lids) + " is known for this map",
                            file.path);
    }
    unsigned long long entries = 0;
    if (!context_.succeeded(content.getEntryCount(entries), {file.path, ""})) return;
    const std::string folder = file.targetPath.substr(0, file.targetPath.rfind('/'));
    if (file.volume == 0) foldersWithoutVolume_.insert(folder);
    const bool isOwner = file.sameAs.empty();  // under another name it has been counted
    if (isOwner) sharedExtents_.beginMap(file.volume != 0 ? std::to_string(file.volume) : folder, file, content);
    MapRules rules(file, content, report_);
    useDataFiles(file, rules);
    const auto each = [&](const MapRun& run) {
        rules.add(run);
        if (isOwner) sharedExtents_.add(run);
    };
    rules.finish(walkAllRuns(context_, file.path, content, entries, each));
    reportUnreadable(rules);
}

/// Where files were named. In a check of the whole store each data file is reported when it is checked itself.
void StoreCheck::reportUnreadable(const MapRules& rules) {
    if (!files_.areNamed()) return;
    for (const auto& [number, failure] : rules.unreadable()) {
        if (unreadable_.insert(failure.subject.file).second) context_.failed(failure);
    }
}

/// Lets the entries be compared with data files, if that can be done.
void StoreCheck::useDataFiles(const StoreFile& file, MapRules& rules) {
    const auto giveUp = [&](const char* why) {
        report_.notCompared(std::string("missing-data-file, beyond-data-file: ") + why, file.path);
    };
    const auto extentSize = file.lun() != nullptr ? std::optional(file.lun()->record.extentSize) : options_.extentSize;
    if (!extentSize) return giveUp("the extent size is not known, give --extent-size");
    if (*extentSize == 0) return giveUp("the extent size is 0");
    if (file.volume == 0) return giveUp("the path names no volume");
    const auto [volume, added] = dataFiles_.try_emplace(file.volume, context_, file.targetPath, false);
    DataFiles& dataFiles = volume->second;
    if (!dataFiles.list()) {
        if (added && files_.areNamed() && dataFiles.error()) context_.failed(*dataFiles.error());
        return giveUp("the data files of the volume cannot be listed");
    }
    rules.useDataFiles(dataFiles, *extentSize);
}

void StoreCheck::checkKinds() {
    for (const std::string& path : kindTypes_.check(report_)) {
        const auto table = tables_.find(context_.root.targetPath(path));
        if (table != tables_.end()) table->second.reset();
    }
}

void StoreCheck::checkSameMaps() {
    for (const StoreFile& map : sameMaps_) checkSameMap(map.path, map.luns, report_);
}

void StoreCheck::checkExtentSizes() {
    for (const Lun& lun : files_.luns()) {
        std::string table;
        const bool onVolume = findTable(context_, lun.mapPath, table);
        if (files_.areNamed() && checked_.count(context_.root.plainPath(lun.mapPath)) == 0 &&
            checked_.count(table) == 0)
            continue;
        const auto extentSize = onVolume ? tableExtentSize(table) : std::nullopt;
        if (extentSize) {
            checkExtentSize(table, *extentSize, lun, report_);
        } else if (onVolume) {
            report_.notCompared("extent-size: no table file that can be compared", table);
        } else {
            report_.notCompared("extent-size: the path of the LUN's map file names no volume", lun.mapPath);
        }
    }
}

/// The extent size in the table file at `path` of the target, which is read unless it has been, with all of the store.
std::optional<std::uint32_t> StoreCheck::tableExtentSize(const std::string& path) {
    const auto [row, added] = tables_.try_emplace(path);
    if (!added || !files_.areNamed() || checked_.count(path) > 0) return row->second;
    const std::optional<std::string> hostPath = context_.openablePath(path, NamedBy::target);
    if (!hostPath) return std::nullopt;
    if (!context_.sizeOf(*hostPath) && (errno == ENOENT || errno == ENOTDIR)) {
        checkMissingFile(missingAt(path, *hostPath), report_);
        return std::nullopt;
    }
    StoreFile file;
    file.path = path;
    file.kind = kindByName(path);
    tool::ISCSIEPFileTBL table(*hostPath);
    if (context_.succeeded(table.parseFile(), {path, ""}) && checkKind(file, table, report_)) {
        row->second = table.extentSize;
    }
    return row->second;
}

void StoreCheck::checkSharedExtents() {
    if (foldersWithoutVolume_.size() > 1) {
        report_.notCompared("shared-extents: maps in different folders whose paths name no volume");
    }
    sharedExtents_.check();
}

}  // namespace inspection
