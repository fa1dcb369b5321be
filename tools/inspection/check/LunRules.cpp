#include "check/LunRules.h"

#include <limits>

namespace inspection {

namespace {

Finding findingOf(const std::string& file, Rule rule, const Lun& lun, const Value& stored, const Value& found) {
    Finding finding = {file, rule, stored, found};
    finding.lid = lun.record.lid;
    return finding;
}

}  // namespace

void tellMissingMap(const StoreFile& file, const Lun& lun, Report& report) {
    report.add(findingOf(file.path, Rule::missingMap, lun, Value::text("LUN " + std::to_string(lun.record.lid)),
                         Value::text("no file")));
}

void checkLunSize(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFileMAP& content, const Lun& lun, Report& report) {
    constexpr std::uint64_t largest = std::numeric_limits<std::uint64_t>::max();
    const std::uint64_t extentSize = lun.record.extentSize;
    const bool fits = extentSize == 0 || content.totalCount <= largest / extentSize;
    const std::uint64_t size = content.totalCount * extentSize;
    if (fits && size == lun.record.size) return;
    const Value stored = fits ? Value::number(size) : Value::text("more than " + std::to_string(largest));
    Finding finding = findingOf(file.path, Rule::lunSize, lun, stored, Value::number(lun.record.size));
    finding.totalCount = content.totalCount;
    finding.extentSize = extentSize;
    report.add(finding);
}

void checkExtentSize(const std::string& table, std::uint32_t extentSize, const Lun& lun, Report& report) {
    if (extentSize == lun.record.extentSize) return;
    report.add(
        findingOf(table, Rule::extentSize, lun, Value::number(extentSize), Value::number(lun.record.extentSize)));
}

}  // namespace inspection
