#include "store/ChosenFiles.h"

#include <filesystem>
#include <system_error>

#include "store/FileSize.h"

namespace epinspect {

namespace fs = std::filesystem;

ChosenFiles::ChosenFiles(Session& session, const std::vector<std::string>& names, Range lids)
    : session_(session), names_(names) {
    if (names.empty()) {
        store_.emplace(session, lids);
    } else {
        forEachLun(session, lids, [this](const Lun& lun) { luns_.push_back(lun); });
    }
}

void ChosenFiles::forEach(const std::function<void(const StoreFile&)>& each) {
    if (store_) return store_->forEachFile(each);
    std::set<fs::path> done;
    for (const std::string& name : names_) {
        const std::optional<std::string> path = session_.openablePath(name);
        std::error_code error;
        if (!path || !done.insert(fs::weakly_canonical(*path, error)).second) continue;
        const std::string targetPath = session_.targetPath(name);
        StoreFile file;
        file.kind = kindByName(targetPath);
        file.path = name;
        file.hostPath = *path;
        file.size = sizeOf(*path).value_or(0);
        file.volume = volumeOf(targetPath);
        file.lun = lunOf(targetPath);
        each(file);
    }
}

const Lun* ChosenFiles::lunOf(const std::string& targetPath) const {
    for (const Lun& lun : luns_) {
        if (plainPath(lun.mapPath) == targetPath) return &lun;
    }
    return nullptr;
}

}  // namespace epinspect
