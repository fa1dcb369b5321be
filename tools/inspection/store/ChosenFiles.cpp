#include "store/ChosenFiles.h"

#include "store/FileSize.h"

namespace inspection {

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
    std::set<FileIdentity> done;
    std::set<std::string> missing;
    for (const std::string& name : names_) {
        const std::optional<std::string> path = context_.openablePath(name, NamedBy::user);
        if (!path) continue;
        StoreFile file;
        file.path = name;
        file.targetPath = context_.root.targetPath(name);
        file.identity = identityOf(*path);
        if (file.identity ? !done.insert(*file.identity).second : !missing.insert(file.targetPath).second) continue;
        file.kind = kindByName(file.targetPath);
        file.misnamed = isMisnamed(file.targetPath);
        file.hostPath = *path;
        file.size = context_.sizeOf(*path).value_or(0);
        file.volume = volumeOf(context_, file.targetPath);
        file.lun = lunOf(file.targetPath);
        each(file);
    }
}

const Lun* ChosenFiles::lunOf(const std::string& targetPath) const {
    for (const Lun& lun : luns_) {
        if (context_.root.plainPath(lun.mapPath) == targetPath) return &lun;
    }
    return nullptr;
}

}  // namespace inspection
