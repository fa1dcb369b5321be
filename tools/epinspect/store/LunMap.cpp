#include "store/LunMap.h"

#include <algorithm>
#include <utility>

#include "CommandLine.h"
#include "Numbers.h"
#include "store/Luns.h"
#include "store/OpenMap.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

constexpr std::uint64_t sizeLimit = std::uint64_t{1} << 63U;

/// Finds out which map file is meant, and what the configuration tells of the LUN. Returns false after a failure.
bool findMap(Session& session, const LunName& lun, LunMap& map) {
    map.lid = lun.lid;
    if (!lun.lid) {
        map.file = lun.file;
        map.targetPath = session.targetPath(lun.file);
        return true;
    }
    Lun known;
    if (!session.succeeded(loadLun(session, *map.lid, known), map.subject(""))) return false;
    map.file = map.targetPath = known.mapPath;
    map.extentSize = known.record.extentSize;
    map.size = std::min<std::uint64_t>(known.record.size, sizeLimit);
    return true;
}

}  // namespace

std::uint64_t LunMap::mappableSize() const {
    return std::min<std::uint64_t>(entries, sizeLimit / extentSize) * extentSize;
}

Subject LunMap::subject(const std::string& part) const {
    if (!lid) return {file, part};
    return {"", "LUN " + std::to_string(*lid) + (part.empty() ? "" : " ") + part};
}

void LunMap::failBeyondEnd(Session& session, const std::string& part) const {
    session.fail(subject(part), "beyond the end, the LUN has " + std::to_string(size) + " bytes",
                 tool::EP_ERR_READ_FAILED);
}

void LunMap::failBeyondMap(Session& session, const std::string& part) const {
    session.fail({file, subject(part).part},
                 "beyond the end, the map's entries stand for " + std::to_string(mappableSize()) + " bytes",
                 tool::EP_ERR_READ_FAILED);
}

LunName parseLunName(const std::string& text) {
    const std::string prefix = text.substr(0, 2);
    const bool number = prefix == "0x" || prefix == "0X" ||
                        (!text.empty() && text.find_first_not_of("0123456789") == std::string::npos);
    if (number) return {parseNumber32(text), ""};
    return {std::nullopt, text};
}

std::optional<LunMap> openLunMap(Session& session, const LunName& lun, std::optional<std::uint32_t> extentSize) {
    if (!lun.lid && !extentSize) throw UsageError{"--extent-size is missing: a map file does not tell it"};
    LunMap map;
    if (!findMap(session, lun, map)) return std::nullopt;
    map.extentSize = extentSize.value_or(map.extentSize);
    if (map.extentSize == 0) {
        session.succeeded(tool::EP_ERR_BAD_EXTENT_SIZE, map.subject(""), 0);
        return std::nullopt;
    }
    OpenedMap opened = openMap(session, map.file);
    if (opened.file == nullptr) return std::nullopt;
    map.map = std::move(opened.file);
    map.entries = opened.entries;
    if (!map.lid) map.size = map.mappableSize();
    return map;
}

}  // namespace epinspect
