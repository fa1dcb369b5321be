#include "store/Store.h"

#include <algorithm>
#include <filesystem>
#include <limits>

#include <etc/ISCSIEPFormat.h>

#include "store/FileNames.h"
#include "store/FileSize.h"
#include "store/Folder.h"

namespace inspection {

namespace fs = std::filesystem;
namespace tool = ISCSI::TOOL;

namespace {

constexpr std::uint64_t journalPlace = 0;
constexpr std::uint64_t noVolumePlace = std::numeric_limits<std::uint64_t>::max();

/// The order of files in a folder: the table first, then the others by name, then data files by number, and last what
/// is only named like them.
bool precedes(const std::string& one, const std::string& other) {
    const auto rank = [](const std::string& name) -> std::size_t {
        if (name == tool::EP_TBL_FILE_NAME) return 0;
        if (isMisnamed(name)) return std::numeric_limits<std::size_t>::max();
        return isDataFileName(name) ? name.size() : 1;
    };
    return std::pair(rank(one), std::string_view(one)) < std::pair(rank(other), std::string_view(other));
}

std::vector<Lun> findLuns(Context& context, const Lids& lids) {
    std::vector<Lun> luns;
    forEachLun(context, lids, [&luns](const Lun& lun) { luns.push_back(lun); });
    return luns;
}

/// Whether what lies at `path` counts as a map file by its folder alone.
bool mayHaveAnyName(const std::string& path) {
    const FileKind* kind = kindByName(path);
    return kind != nullptr && kind->type == tool::EP_FILE_TYPE_MAP && !mapNameIn(lastName(path));
}

}  // namespace

std::uint32_t volumeOf(Context& context, const std::string& path) {
    const Trial trial(context);
    std::string table;
    if (tool::ISCSIEPFile(path).getTBLFilePath(table) != 0) return 0;
    return volumeIn(std::string_view(table).substr(1, table.find('/', 1) - 1));
}

void failEmptyStore(Context& context) {
    const std::string top = context.root.hostPath("");
    context.fail({top.empty() ? "/" : top, ""}, "no EP files found", tool::EP_ERR_NO_PATH);
}

Store::Store(Context& context, const Lids& lids) : Store(context, findLuns(context, lids)) {}

Store::Store(Context& context, std::vector<Lun> luns) : context_(context), luns_(std::move(luns)) {
    if (context.collection && !context.collection->complete) {
        context.fail({context.root.hostPath(""), ""}, "files may be missing, the collection is incomplete", 0);
    }
    std::string journal;
    tool::ISCSIEPFile("").getJNLFilePath(journal);
    const std::string journalFolder = fs::path(journal).parent_path().string();
    folders_[{journalPlace, journalFolder}];
    if (!luns_.empty()) folders_[{journalPlace, journalFolder}].insert(fs::path(journal).filename().string());
    for (const Lun& lun : luns_) {
        const std::string map = context.root.plainPath(lun.mapPath);
        lunsByMap_.add(map, lun);
        expect(map);
        const Trial trial(context);
        const tool::ISCSIEPFile file(map);
        std::string path;
        if (file.getTBLFilePath(path) == 0) expect(path);
        if (file.getFRIFilePath(path) == 0) expect(path);
    }
    for (const std::string& name : namesIn("/")) {
        const std::uint32_t volume = volumeIn(name);
        if (volume == 0) continue;
        for (const std::string_view folder : {tool::EP_VOLUME_FOLDER, tool::EP_MAP_FOLDER}) {
            folders_[{volume, "/" + name + std::string(folder.substr(0, folder.size() - 1))}];
        }
    }
}

void Store::expect(const std::string& path) {
    const auto slash = path.rfind('/');
    const std::uint32_t volume = volumeOf(context_, path);
    folders_[{volume != 0 ? volume : noVolumePlace, path.substr(0, slash)}].insert(path.substr(slash + 1));
}

void Store::reportOnce(const Failure& failure) {
    if (reported_.insert(failure.subject.file).second) context_.failed(failure);
}

/// The names in a folder, as far as it could be listed.
std::vector<std::string> Store::namesIn(const std::string& folder) {
    Listing listing = listFolder(context_, folder);
    if (listing.failure) reportOnce(*listing.failure);
    return std::move(listing.names);
}

std::vector<std::string> Store::storeFilesIn(const std::string& folder, std::set<std::string> expected) {
    for (std::string& name : namesIn(folder)) {
        if (kindByName(pathIn(folder, name)) != nullptr) expected.insert(std::move(name));
    }
    std::vector<std::string> sorted(expected.begin(), expected.end());
    std::sort(sorted.begin(), sorted.end(), precedes);
    return sorted;
}

/// The file at `path` of the target. Nothing when it may not be opened, which is reported, or when it is a folder that
/// no LUN is expected to have there.
std::optional<StoreFile> Store::fileAt(const std::string& path, bool isExpected) {
    const Located located = context_.root.locate(path);
    if (located.isFolder() && !isExpected && mayHaveAnyName(path)) return std::nullopt;
    if (const auto obstacle = located.obstacleToFile(path)) {
        reportOnce(located.isThere() ? *obstacle : failureOf(located, path));
        return std::nullopt;
    }
    StoreFile file;
    file.path = file.targetPath = path;
    file.hostPath = located.hostPath;
    file.missing = located.isMissing();
    const auto size = file.missing ? 0 : context_.sizeOf(file.hostPath);
    if (!size) {
        context_.succeeded(tool::EP_ERR_OPEN_FAILED, {path, ""});
        return std::nullopt;
    }
    file.size = *size;
    if (!file.missing) {
        file.identity = located.identity;
        const auto [first, added] = firstPaths_.try_emplace(located.identity, path);
        if (!added) file.sameAs = first->second;
    }
    describe(file);
    return file;
}

/// Fills in what follows from the file's name and from the configuration.
void Store::describe(StoreFile& file) {
    file.luns = lunsByMap_.at(file.targetPath);
    const Lun* lun = file.lun();
    file.kind = lun != nullptr ? kindByType(tool::EP_FILE_TYPE_MAP) : kindByName(file.targetPath);
    file.misnamed = isMisnamed(file.targetPath);
    file.link = context_.root.linkAt(file.targetPath);
    file.volume = volumeOf(context_, file.targetPath);
    if (lun == nullptr) {
        if (file.kind->type == tool::EP_FILE_TYPE_MAP) file.mapName = mapNameIn(lastName(file.targetPath));
    } else {
        file.mapName = {lun->record.getTypeName(), lun->record.uuid, lun->record.name};
    }
}

void Store::forEachFile(const std::function<void(const StoreFile&)>& each) {
    firstPaths_.clear();
    for (const auto& [place, expected] : folders_) {
        const std::string& folder = place.second;
        for (const std::string& name : storeFilesIn(folder, expected)) {
            const auto file = fileAt(pathIn(folder, name), expected.count(name) > 0);
            if (file) each(*file);
        }
    }
}

}  // namespace inspection
