#include "store/LunMap.h"

#include <algorithm>
#include <cerrno>

#include "CommandLine.h"
#include "Numbers.h"
#include "store/Doubts.h"
#include "store/Luns.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

constexpr std::uint64_t sizeLimit = std::uint64_t{1} << 63U;

bool isNumber(const std::string& text) {
    const std::string prefix = text.substr(0, 2);
    return prefix == "0x" || prefix == "0X" ||
           (!text.empty() && text.find_first_not_of("0123456789") == std::string::npos);
}

/// Finds out which map file is meant, and what the configuration tells of the LUN. Returns false after a failure.
bool findMap(Session& session, const std::string& lun, LunMap& map) {
    if (!isNumber(lun)) {
        map.file = lun;
        map.targetPath = session.targetPath(lun);
        return true;
    }
    map.lid = parseNumber32(lun);
    Lun known;
    if (!session.succeeded(loadLun(*map.lid, known), map.subject(""))) return false;
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

std::optional<LunMap> openLunMap(Session& session, const std::string& lun, std::optional<std::uint32_t> extentSize) {
    if (!isNumber(lun) && !extentSize) throw UsageError{"--extent-size is missing, which a map file does not tell"};
    LunMap map;
    if (!findMap(session, lun, map)) return std::nullopt;
    map.extentSize = extentSize.value_or(map.extentSize);
    if (map.extentSize == 0) {
        session.succeeded(tool::EP_ERR_BAD_EXTENT_SIZE, map.subject(""), 0);
        return std::nullopt;
    }
    const std::optional<std::string> path = session.openablePath(map.file);
    if (!path) return std::nullopt;
    map.map = std::make_unique<tool::ISCSIEPFileMAP>(*path);
    unsigned long long entries = 0;
    if (!session.succeeded(map.map->getEntryCount(entries), {map.file, ""})) return std::nullopt;
    sayDataStartDoubts(*map.map, map.file);
    sayPartialEntry(*map.map, map.file);
    map.entries = entries;
    if (!map.lid) map.size = map.mappableSize();
    return map;
}

}  // namespace epinspect
