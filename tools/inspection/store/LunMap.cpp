#include "store/LunMap.h"

#include <algorithm>
#include <utility>

#include "store/OpenMap.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

constexpr std::uint64_t sizeLimit = std::uint64_t{1} << 63U;

/// The extent size of the first LUN, with a remark where the others have another one.
std::uint32_t extentSizeOf(Context& context, const NamedMap& map) {
    const std::uint32_t extentSize = map.luns.front().record.extentSize;
    for (const Lun& lun : map.luns) {
        if (lun.record.extentSize == extentSize) continue;
        const std::string other = std::to_string(lun.record.lid);
        context.remark(map.file, "LUN " + other + " has this map file too, with another extent size");
    }
    return extentSize;
}

/// Says why nothing is known of the LUN whose map this is.
void reportUnknown(Context& context, const NamedMap& map) {
    for (const Failure& failure : map.failures) context.failed(failure);
    context.fail({map.file, ""},
                 "extent size not known, give --extent-size: no LUN with " + idsText(usualLids) + " has this map file",
                 tool::EP_ERR_BAD_EXTENT_SIZE);
}

}  // namespace

std::uint64_t LunMap::mappableSize() const {
    return std::min<std::uint64_t>(entries, sizeLimit / extentSize) * extentSize;
}

LunMap LunMap::copy() const {
    auto own = std::make_unique<tool::ISCSIEPFileMAP>(map->path);
    return {lids, file, targetPath, std::move(own), extentSize, {}, entries, size, state};
}

Subject LunMap::subject(const std::string& part) const {
    if (lids.empty()) return {file, part};
    return {"", "LUN " + std::to_string(lids.front()) + (part.empty() ? "" : " ") + part, lids.front(), file};
}

Failure LunMap::pastEnd(const std::string& part) const {
    return {subject(part), tool::EP_ERR_READ_FAILED, 0, "past the end, the LUN has " + std::to_string(size) + " bytes"};
}

Failure LunMap::pastMap(const std::string& part) const {
    return {{file, subject(part).part, subject(part).lid},
            tool::EP_ERR_READ_FAILED,
            0,
            "past the end, the map's entries stand for " + std::to_string(mappableSize()) + " bytes"};
}

std::optional<LunMap> openLunMap(Context& context, const LunName& lun, std::optional<std::uint32_t> extentSize) {
    const std::optional<NamedMap> named = findMap(context, lun);
    if (!named) return std::nullopt;
    const bool known = !named->luns.empty();
    LunMap map;
    map.lids = named->lids();
    map.file = named->file;
    map.targetPath = named->targetPath;
    if (extentSize || known) map.extentSize = extentSize ? *extentSize : extentSizeOf(context, *named);
    if (known && map.extentSize == 0) {
        context.failed({map.subject(""), tool::EP_ERR_BAD_EXTENT_SIZE, 0, {}});
        return std::nullopt;
    }
    OpenedMap opened = openMap(context, map.file, named->by);
    if (opened.file == nullptr) return std::nullopt;
    if (map.extentSize == 0) {
        reportUnknown(context, *named);
        return std::nullopt;
    }
    map.map = std::move(opened.file);
    map.watch = opened.watch;
    map.entries = opened.entries;
    map.state = stateOf(map.map->path);
    map.size = known ? std::min<std::uint64_t>(named->luns.front().record.size, sizeLimit) : map.mappableSize();
    return map;
}

}  // namespace inspection
