#include "store/Store.h"

#include <algorithm>
#include <cctype>
#include <cerrno>
#include <charconv>
#include <filesystem>
#include <limits>
#include <system_error>

#include "SystemLog.h"
#include "store/FileSize.h"
#include "store/Folder.h"

namespace epinspect {

namespace fs = std::filesystem;
namespace tool = ISCSI::TOOL;

namespace {

constexpr std::uint64_t journalPlace = 0;
constexpr std::uint64_t noVolumePlace = std::numeric_limits<std::uint64_t>::max();

/// The number in the name of a volume's folder, 0 when it is not "volume" and a number in plain form.
std::uint32_t volumeIn(std::string_view name) {
    static constexpr std::string_view prefix = "volume";
    if (name.substr(0, prefix.size()) != prefix) return 0;
    name.remove_prefix(prefix.size());
    std::int32_t number = 0;
    const auto result = std::from_chars(name.data(), name.data() + name.size(), number);
    const bool plain = !name.empty() && name[0] >= '1' && result.ptr == name.data() + name.size();
    return plain && result.ec == std::errc() ? static_cast<std::uint32_t>(number) : 0;
}

/// Whether `text` has the form of a UUID.
bool isUUID(std::string_view text) {
    for (std::size_t i = 0; i < text.size(); ++i) {
        const bool dash = i == 8 || i == 13 || i == 18 || i == 23;
        if (dash ? text[i] != '-' : std::isxdigit(static_cast<unsigned char>(text[i])) == 0) return false;
    }
    return text.size() == 36;
}

/// Calls each(entry) for what lies in the folder at `path` of the target, which may be missing. Reports failures.
template <typename Each>
void visitFolder(Session& session, const std::string& path, Each&& each) {
    const std::error_code error = listFolder(session, path, each);
    session.succeeded(error ? tool::EP_ERR_OPEN_FAILED : 0, {path, ""}, error.value());
}

/// The order of files in a folder: the table first, data files last and by number, the others by name.
bool precedes(const std::string& one, const std::string& other) {
    const auto rank = [](const std::string& name) -> std::size_t {
        if (name == "EP_TBL") return 0;
        return name.compare(0, 7, "EP_DAT_") == 0 ? name.size() : 1;
    };
    return std::pair(rank(one), std::string_view(one)) < std::pair(rank(other), std::string_view(other));
}

}  // namespace

std::string plainPath(const std::string& path) { return fs::path("/" + path).lexically_normal().string(); }

std::optional<MapName> mapNameIn(std::string_view fileName) {
    static constexpr std::string_view end = "_00000";
    const auto dash = fileName.find('-');  // no type name holds one: it is the UUID's
    if (dash == std::string_view::npos || dash <= 8 || fileName.size() < dash + 28 + end.size()) return std::nullopt;
    const auto typeName = fileName.substr(0, dash - 8);
    const auto uuid = fileName.substr(typeName.size(), 36);
    fileName.remove_prefix(typeName.size() + uuid.size());
    if (!isUUID(uuid) || fileName.substr(fileName.size() - end.size()) != end) return std::nullopt;
    fileName.remove_suffix(end.size());
    return MapName{std::string(typeName), std::string(uuid), std::string(fileName)};
}

std::uint32_t volumeOf(const std::string& path) {
    const QuietLog quiet;
    std::string table;
    if (tool::ISCSIEPFile(path).getTBLFilePath(table) != 0) return 0;
    return volumeIn(std::string_view(table).substr(1, table.find('/', 1) - 1));
}

Store::Store(Session& session, Range lids) : session_(session) {
    forEachLun(session, lids, [this](const Lun& lun) { luns_.push_back(lun); });
    std::string journal;
    tool::ISCSIEPFile("").getJNLFilePath(journal);
    const std::string journalFolder = fs::path(journal).parent_path().string();
    folders_[{journalPlace, journalFolder}];
    if (!luns_.empty()) folders_[{journalPlace, journalFolder}].insert(fs::path(journal).filename().string());
    for (const Lun& lun : luns_) {
        const std::string map = plainPath(lun.mapPath);
        lunsByMap_.emplace(map, &lun);
        expect(map);
        const QuietLog quiet;
        const tool::ISCSIEPFile file(map);
        std::string path;
        if (file.getTBLFilePath(path) == 0) expect(path);
        if (file.getFRIFilePath(path) == 0) expect(path);
    }
    visitFolder(session, "/", [this](const fs::directory_entry& entry) {
        const std::string name = entry.path().filename().string();
        const std::uint32_t volume = volumeIn(name);
        if (volume == 0) return;
        folders_[{volume, "/" + name + "/@iSCSI/EP"}];
        folders_[{volume, "/" + name + "/@iSCSI/LUN"}];
    });
}

void Store::expect(const std::string& path) {
    const auto slash = path.rfind('/');
    const std::uint32_t volume = volumeOf(path);
    folders_[{volume != 0 ? volume : noVolumePlace, path.substr(0, slash)}].insert(path.substr(slash + 1));
}

std::vector<std::string> Store::namesIn(const std::string& folder, std::set<std::string> names) {
    visitFolder(session_, folder, [&](const fs::directory_entry& entry) {
        std::error_code error;
        std::string name = entry.path().filename().string();
        if (kindByName(folder + "/" + name) != nullptr && !entry.is_directory(error)) names.insert(std::move(name));
    });
    std::vector<std::string> sorted(names.begin(), names.end());
    std::sort(sorted.begin(), sorted.end(), precedes);
    return sorted;
}

std::optional<StoreFile> Store::fileAt(const std::string& path) {
    const std::optional<std::string> hostPath = session_.openablePath(path);
    if (!hostPath) return std::nullopt;
    StoreFile file;
    const auto lun = lunsByMap_.find(path);
    file.kind = lun != lunsByMap_.end() ? kindByType(tool::EP_FILE_TYPE_MAP) : kindByName(path);
    file.path = path;
    file.hostPath = *hostPath;
    const auto size = sizeOf(file.hostPath);
    file.missing = !size && (errno == ENOENT || errno == ENOTDIR);
    if (!size && !file.missing) {
        session_.succeeded(tool::EP_ERR_OPEN_FAILED, {path, ""});
        return std::nullopt;
    }
    file.size = size.value_or(0);
    file.volume = volumeOf(path);
    if (lun == lunsByMap_.end()) {
        if (file.kind->type == tool::EP_FILE_TYPE_MAP) file.mapName = mapNameIn(fs::path(path).filename().string());
    } else {
        file.lun = lun->second;
        file.mapName = {typeNameOf(file.lun->record), file.lun->record.uuid, file.lun->record.name};
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

}  // namespace epinspect
