#include "store/Store.h"

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <limits>
#include <system_error>

#include <etc/ISCSIEPFormat.h>

#include "store/FileSize.h"
#include "store/Folder.h"

namespace inspection {

namespace fs = std::filesystem;
namespace tool = ISCSI::TOOL;

namespace {

constexpr std::uint64_t journalPlace = 0;
constexpr std::uint64_t noVolumePlace = std::numeric_limits<std::uint64_t>::max();

/// Calls each(entry) for what lies in the folder at `path` of the target, which may be missing. Reports failures.
template <typename Each>
void visitFolder(Context& context, const std::string& path, Each&& each) {
    const std::error_code error = listFolder(context, path, each);
    if (error) context.failed({{path, ""}, tool::EP_ERR_OPEN_FAILED, error.value(), {}});
}

/// The order of files in a folder: the table first, data files last and by number, the others by name.
bool precedes(const std::string& one, const std::string& other) {
    const auto rank = [](const std::string& name) -> std::size_t {
        if (name == tool::EP_TBL_FILE_NAME) return 0;
        return isDataFileName(name) ? name.size() : 1;
    };
    return std::pair(rank(one), std::string_view(one)) < std::pair(rank(other), std::string_view(other));
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

Store::Store(Context& context, const Lids& lids) : context_(context) {
    forEachLun(context, lids, [this](const Lun& lun) { luns_.push_back(lun); });
    std::string journal;
    tool::ISCSIEPFile("").getJNLFilePath(journal);
    const std::string journalFolder = fs::path(journal).parent_path().string();
    folders_[{journalPlace, journalFolder}];
    if (!luns_.empty()) folders_[{journalPlace, journalFolder}].insert(fs::path(journal).filename().string());
    for (const Lun& lun : luns_) {
        const std::string map = plainPath(lun.mapPath);
        lunsByMap_.add(lun);
        expect(map);
        const Trial trial(context);
        const tool::ISCSIEPFile file(map);
        std::string path;
        if (file.getTBLFilePath(path) == 0) expect(path);
        if (file.getFRIFilePath(path) == 0) expect(path);
    }
    visitFolder(context, "/", [this](const fs::directory_entry& entry) {
        const std::string name = entry.path().filename().string();
        const std::uint32_t volume = volumeIn(name);
        if (volume == 0) return;
        folders_[{volume, "/" + name + "/@iSCSI/EP"}];
        folders_[{volume, "/" + name + "/@iSCSI/LUN"}];
    });
}

void Store::expect(const std::string& path) {
    const auto slash = path.rfind('/');
    const std::uint32_t volume = volumeOf(context_, path);
    folders_[{volume != 0 ? volume : noVolumePlace, path.substr(0, slash)}].insert(path.substr(slash + 1));
}

std::vector<std::string> Store::namesIn(const std::string& folder, std::set<std::string> names) {
    visitFolder(context_, folder, [&](const fs::directory_entry& entry) {
        std::error_code error;
        std::string name = entry.path().filename().string();
        const FileKind* kind = kindByName(folder + "/" + name);
        const bool anyName = kind != nullptr && kind->type == tool::EP_FILE_TYPE_MAP && !mapNameIn(name);
        if (kind != nullptr && !(anyName && entry.is_directory(error))) names.insert(std::move(name));
    });
    std::vector<std::string> sorted(names.begin(), names.end());
    std::sort(sorted.begin(), sorted.end(), precedes);
    return sorted;
}

std::optional<StoreFile> Store::fileAt(const std::string& path) {
    const std::optional<std::string> hostPath = context_.openablePath(path);
    if (!hostPath) return std::nullopt;
    StoreFile file;
    file.luns = lunsByMap_.at(path);
    file.kind = file.lun() != nullptr ? kindByType(tool::EP_FILE_TYPE_MAP) : kindByName(path);
    file.path = path;
    file.hostPath = *hostPath;
    const auto size = context_.sizeOf(file.hostPath);
    file.missing = !size && (errno == ENOENT || errno == ENOTDIR);
    if (!size && !file.missing) {
        context_.succeeded(tool::EP_ERR_OPEN_FAILED, {path, ""});
        return std::nullopt;
    }
    file.size = size.value_or(0);
    file.volume = volumeOf(context_, path);
    if (const Lun* lun = file.lun()) {
        file.mapName = {lun->record.getTypeName(), lun->record.uuid, lun->record.name};
    } else if (file.kind->type == tool::EP_FILE_TYPE_MAP) {
        file.mapName = mapNameIn(fs::path(path).filename().string());
    }
    return file;
}

void Store::forEachFile(const std::function<void(const StoreFile&)>& each) {
    for (const auto& [place, expected] : folders_) {
        for (const std::string& name : namesIn(place.second, expected)) {
            const std::optional<StoreFile> file = fileAt(place.second + "/" + name);
            if (file) each(*file);
        }
    }
}

}  // namespace inspection
