#include "store/LunMap.h"

#include <algorithm>
#include <utility>

#include "store/Luns.h"
#include "store/OpenMap.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

constexpr std::uint64_t sizeLimit = std::uint64_t{1} << 63U;

/// Finds out which map file is meant, and what the configuration tells of the LUN. Returns false after a failure.
bool findMap(Context& context, const LunName& lun, LunMap& map) {
    map.lid = lun.lid;
    if (!lun.lid) {
        map.file = lun.file;
        map.targetPath = context.root.targetPath(lun.file);
        return true;
    }
    Lun known;
    if (!context.succeeded(loadLun(context, *map.lid, known), map.subject(""))) return false;
    map.file = map.targetPath = known.mapPath;
    map.extentSize = known.record.extentSize;
    map.size = std::min<std::uint64_t>(known.record.size, sizeLimit);
    return true;
}

}  // namespace

std::uint64_t LunMap::mappableSize() const {
    return std::min<std::uint64_t>(entries, sizeLimit / extentSize) * extentSize;
}

LunMap LunMap::copy() const {
    return {lid, file, targetPath, std::make_unique<tool::ISCSIEPFileMAP>(map->path), extentSize, {}, entries, size};
}

Subject LunMap::subject(const std::string& part) const {
    if (!lid) return {file, part};
    return {"", "LUN " + std::to_string(*lid) + (part.empty() ? "" : " ") + part};
}

Failure LunMap::pastEnd(const std::string& part) const {
    return {subject(part), tool::EP_ERR_READ_FAILED, 0, "past the end, the LUN has " + std::to_string(size) + " bytes"};
}

Failure LunMap::pastMap(const std::string& part) const {
    return {{file, subject(part).part},
            tool::EP_ERR_READ_FAILED,
            0,
            "past the end, the map's entries stand for " + std::to_string(mappableSize()) + " bytes"};
}

Typed<LunName> lunNameIn(const std::string& text) {
    const std::string prefix = text.substr(0, 2);
    const bool number = prefix == "0x" || prefix == "0X" ||
                        (!text.empty() && text.find_first_not_of("0123456789") == std::string::npos);
    if (!number) return LunName{std::nullopt, text};
    const auto lid = numberIn(text, most32Bits);
    if (lid.fault != nullptr) return lid.fault;
    return LunName{static_cast<std::uint32_t>(lid.value), ""};
}

std::optional<LunMap> openLunMap(Context& context, const LunName& lun, std::optional<std::uint32_t> extentSize) {
    LunMap map;
    if (!findMap(context, lun, map)) return std::nullopt;
    map.extentSize = extentSize.value_or(map.extentSize);
    if (map.extentSize == 0) {
        context.failed({map.subject(""), tool::EP_ERR_BAD_EXTENT_SIZE, 0, {}});
        return std::nullopt;
    }
    OpenedMap opened = openMap(context, map.file);
    if (opened.file == nullptr) return std::nullopt;
    map.map = std::move(opened.file);
    map.watch = opened.watch;
    map.entries = opened.entries;
    if (!map.lid) map.size = map.mappableSize();
    return map;
}

}  // namespace inspection
