#include "store/ChosenFiles.h"

#include <filesystem>
#include <system_error>

#include "store/FileSize.h"

namespace inspection {

namespace fs = std::filesystem;

ChosenFiles::ChosenFiles(Context& context, const std::vector<std::string>& names, Range lids)
    : context_(context), names_(names) {
    if (names.empty()) {
        store_.emplace(context, lids);
    } else {
        forEachLun(context, lids, [this](const Lun& lun) { luns_.push_back(lun); });
    }
}

void ChosenFiles::forEach(const std::function<void(const StoreFile&)>& each) {
    if (store_) return store_->forEachFile(each);
    std::set<fs::path> done;
    for (const std::string& name : names_) {
        const std::optional<std::string> path = context_.openablePath(name);
        std::error_code error;
        if (!path || !done.insert(fs::weakly_canonical(*path, error)).second) continue;
        const std::string targetPath = context_.root.targetPath(name);
        StoreFile file;
        file.kind = kindByName(targetPath);
        file.path = name;
        file.hostPath = *path;
        file.size = context_.sizeOf(*path).value_or(0);
        file.identity = identityOf(*path);
        file.volume = volumeOf(context_, targetPath);
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

}  // namespace inspection
