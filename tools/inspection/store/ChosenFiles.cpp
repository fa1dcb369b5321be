#include "store/ChosenFiles.h"

#include <algorithm>

#include "store/FileSize.h"

namespace inspection {

ChosenFiles::ChosenFiles(Context& context, const std::vector<LunName>& names, const Lids& lids)
    : context_(context), names_(names) {
    if (names.empty()) {
        store_.emplace(context, lids);
    } else {
        loadNamed(lids);
    }
}

void ChosenFiles::loadNamed(const Lids& lids) {
    std::map<std::uint32_t, Lun> luns;
    std::set<std::uint32_t> named;
    for (const LunName& name : names_) {
        Lun lun;
        if (!name.lid || !named.insert(*name.lid).second) continue;
        if (context_.succeeded(loadLun(context_, *name.lid, lun), subjectOf({*name.lid, *name.lid}))) {
            luns.emplace(*name.lid, lun);
        }
    }
    const LunTrial trial = tryLuns(context_, lids, [&luns](const Lun& lun) { luns.emplace(lun.record.lid, lun); });
    for (const Failure& failure : trial.failures) {
        if (!failure.subject.lid || named.count(*failure.subject.lid) == 0) context_.failed(failure);
    }
    if (trial.none && named.empty() && (lids.asked || isUnreadable(*trial.none))) context_.failed(*trial.none);
    for (auto& [lid, lun] : luns) luns_.push_back(std::move(lun));
    for (const Lun& lun : luns_) lunsByMap_.add(context_.root.plainPath(lun.mapPath), lun);
}

const Lun* ChosenFiles::lunOf(std::uint32_t lid) const {
    const auto found = std::lower_bound(luns_.begin(), luns_.end(), lid,
                                        [](const Lun& lun, std::uint32_t id) { return lun.record.lid < id; });
    return found != luns_.end() && found->record.lid == lid ? &*found : nullptr;
}

void ChosenFiles::forEach(const std::function<void(const StoreFile&)>& each) {
    if (store_) return store_->forEachFile(each);
    std::set<FileIdentity> done;
    std::set<std::string> missing;
    for (const LunName& typed : names_) {
        const Lun* lun = typed.lid ? lunOf(*typed.lid) : nullptr;
        if (typed.lid && lun == nullptr) continue;  // reported already
        const std::string& name = lun != nullptr ? lun->mapPath : typed.file;
        const std::optional<std::string> path =
            context_.openablePath(name, lun != nullptr ? NamedBy::target : NamedBy::user);
        if (!path) continue;
        StoreFile file;
        file.path = name;
        file.by = lun != nullptr ? NamedBy::target : NamedBy::user;
        file.targetPath = context_.root.targetPath(name);
        file.identity = identityOf(*path);
        if (file.identity ? !done.insert(*file.identity).second : !missing.insert(file.targetPath).second) continue;
        file.kind = kindByName(file.targetPath);
        file.misnamed = isMisnamed(file.targetPath);
        file.hostPath = *path;
        file.size = context_.sizeOf(*path).value_or(0);
        file.volume = volumeOf(context_, file.targetPath);
        file.luns = lunsByMap_.at(file.targetPath);
        each(file);
    }
}

}  // namespace inspection
