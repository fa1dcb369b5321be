#include "check/LunRules.h"

#include <limits>

namespace inspection {

namespace {

Finding findingOf(const std::string& file, Rule rule, const Lun& lun, const Value& stored, const Value& found) {
    Finding finding = {file, rule, stored, found};
    finding.lid = lun.record.lid;
    return finding;
}

std::string nameOf(const Lun& lun) { return "LUN " + std::to_string(lun.record.lid); }

Value missing(const MissingFile& file) { return Value::text(file.isLink ? "a link that leads nowhere" : "no file"); }

}  // namespace

void checkMissingMap(const MissingFile& file, Report& report) {
    for (const Lun* lun : file.luns) {
        report.add(findingOf(file.path, Rule::missingMap, *lun, Value::text(nameOf(*lun)), missing(file)));
    }
}

void checkMissingFile(const MissingFile& file, Report& report) {
    Finding finding = {file.path, Rule::missingFile, Value::text("a link"), missing(file)};
    if (!file.luns.empty()) {
        finding.stored = Value::text(nameOf(*file.luns.front()));
        finding.lid = file.luns.front()->record.lid;
        finding.moreLuns = file.luns.size() - 1;
    }
    report.add(finding);
}

void checkMissingDataFile(const MissingFile& file, Report& report) {
    report.add({file.path, Rule::missingDataFile, Value::text("a link"), missing(file)});
}

void checkSameMap(const std::string& map, const std::vector<const Lun*>& luns, Report& report) {
    for (std::size_t i = 1; i < luns.size(); ++i) {
        Finding finding =
            findingOf(map, Rule::sameMap, *luns[i], Value::text(nameOf(*luns[i])), Value::text(nameOf(*luns.front())));
        finding.otherLid = luns.front()->record.lid;
        report.add(finding);
    }
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
