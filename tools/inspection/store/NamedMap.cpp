#include "store/NamedMap.h"

#include <etc/ISCSIEPFormat.h>

#include "store/FileKind.h"
#include "store/FileNames.h"

namespace inspection {

Typed<LunName> lunNameIn(const std::string& text) {
    if (text.empty()) return "must not be empty";
    const bool isId = text.find_first_not_of("0123456789") == std::string::npos;
    if (!isId) return LunName{std::nullopt, text};
    const auto lid = numberIn(text, most32Bits);
    if (lid.fault != nullptr) return lid.fault;
    return LunName{static_cast<std::uint32_t>(lid.value), ""};
}

std::vector<std::uint32_t> NamedMap::lids() const {
    std::vector<const Lun*> all;
    for (const Lun& lun : luns) all.push_back(&lun);
    return lidsOf(all);
}

std::optional<NamedMap> findMap(Context& context, const LunName& name) {
    if (name.lid) {
        Lun lun;
        const Lids lids = {*name.lid, *name.lid};
        if (!context.succeeded(loadLun(context, *name.lid, lun), subjectOf(lids))) return std::nullopt;
        return NamedMap{lun.mapPath, NamedBy::target, context.root.plainPath(lun.mapPath), {lun}, {}};
    }
    NamedMap map = {name.file, NamedBy::user, context.root.targetPath(name.file), {}, {}};
    const FileKind* kind = kindByName(map.targetPath);
    if (kind == nullptr || kind->type != ISCSI::TOOL::EP_FILE_TYPE_MAP) return map;
    LunTrial trial = tryLuns(context, usualLids, [&](const Lun& lun) {
        if (context.root.plainPath(lun.mapPath) == map.targetPath) map.luns.push_back(lun);
    });
    map.failures = std::move(trial.failures);
    if (trial.none && isUnreadable(*trial.none)) map.failures.push_back(*trial.none);
    return map;
}

}  // namespace inspection
