#include "check/LunRules.h"

#include <limits>

namespace epinspect {

namespace {

std::string nameOf(const Lun& lun) { return "LUN " + std::to_string(lun.record.lid); }

void add(Report& report, const std::string& file, const char* rule, const Lun& lun, const Value& stored,
         const Value& found, const std::string& message) {
    report.add({file, rule, stored, found, message, std::nullopt, std::nullopt, lun.record.lid});
}

}  // namespace

void tellMissingMap(const StoreFile& file, const Lun& lun, Report& report) {
    add(report, file.path, "missing-map", lun, Value::text(nameOf(lun)), Value::text("no file"),
        nameOf(lun) + " is configured, but has no map file");
}

void checkLunSize(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFileMAP& content, const Lun& lun, Report& report) {
    constexpr std::uint64_t largest = std::numeric_limits<std::uint64_t>::max();
    const std::uint64_t extentSize = lun.record.extentSize;
    const bool fits = extentSize == 0 || content.totalCount <= largest / extentSize;
    const std::uint64_t size = content.totalCount * extentSize;
    if (fits && size == lun.record.size) return;
    const Value stored = fits ? Value::number(size) : Value::text("more than " + std::to_string(largest));
    add(report, file.path, "lun-size", lun, stored, Value::number(lun.record.size),
        std::to_string(content.totalCount) + " entries of " + std::to_string(extentSize) + " bytes are " +
            stored.shown() + " bytes, " + nameOf(lun) + " has " + std::to_string(lun.record.size));
}

void checkExtentSize(const std::string& table, std::uint32_t extentSize, const Lun& lun, Report& report) {
    if (extentSize == lun.record.extentSize) return;
    add(report, table, "extent-size", lun, Value::number(extentSize), Value::number(lun.record.extentSize),
        std::to_string(extentSize) + " stored, " + nameOf(lun) + " has " + std::to_string(lun.record.extentSize));
}

}  // namespace epinspect
