#include "check/HeadRules.h"

#include <map>

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

/// Compares the value of each row with the one that more than half of the rows have.
template <typename Row, typename ValueOf>
void checkAgainstMost(const std::vector<Row>& rows, Rule rule, ValueOf&& valueOf, Report& report) {
    std::map<std::uint64_t, std::size_t> counts;
    for (const Row& row : rows) ++counts[valueOf(row).bits];
    for (const auto& [common, count] : counts) {
        if (count <= rows.size() / 2) continue;
        for (const Row& row : rows) {
            const Value stored = valueOf(row);
            if (stored.bits == common) continue;
            report.add({row.file, rule, stored, {stored.form, common, {}}});
        }
        return;
    }
    if (!rows.empty()) report.notCompared(std::string(nameOf(rule)) + ": no value that most files have");
}

}  // namespace

bool checkKind(const StoreFile& file, const tool::ISCSIEPFile& content, Report& report) {
    if (file.kind == nullptr) report.notCompared("kind: the file's name does not say which", file.path);
    const auto doubt = kindDoubtOf(content, file.kind);
    if (!doubt) return true;
    Finding finding = {file.path, Rule::kind, Value::number(doubt->type), Value::text(doubt->byName->name)};
    finding.kinds = doubt;
    report.add(finding);
    return false;
}

void checkDataStart(const StoreFile& file, const tool::ISCSIEPFile& content, Report& report) {
    const auto doubt = dataStartDoubtOf(content, file.size);
    if (!doubt) return;
    Finding finding = {file.path, Rule::dataStart, Value::hexadecimal(content.head0DataStartOffset),
                       Value::number(doubt->limit)};
    finding.dataStart = doubt;
    report.add(finding);
}

void CommonValues::add(const StoreFile& file, const tool::ISCSIEPFile& content) {
    rows_.push_back({file.path, content.head0MagicCode, content.head0Version});
}

void CommonValues::check(Report& report) const {
    if (rows_.size() == 1) {
        report.notCompared("magic, version: there is no other file");
        return;
    }
    checkMagic(report);
    checkVersion(report);
}

void CommonValues::checkMagic(Report& report) const {
    checkAgainstMost(
        rows_, Rule::magic, [](const Row& row) { return Value::hexadecimal(row.magic); }, report);
}

void CommonValues::checkVersion(Report& report) const {
    checkAgainstMost(
        rows_, Rule::version, [](const Row& row) { return Value::number(row.version); }, report);
}

}  // namespace inspection
