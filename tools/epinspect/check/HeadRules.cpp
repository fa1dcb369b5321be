#include "check/HeadRules.h"

#include <map>

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

/// Compares the value of each row with the one that more than half of the rows have.
template <typename Row, typename ValueOf>
void checkAgainstMost(const std::vector<Row>& rows, const char* rule, ValueOf&& valueOf, Report& report) {
    std::map<std::uint64_t, std::size_t> counts;
    for (const Row& row : rows) ++counts[valueOf(row).bits];
    for (const auto& [common, count] : counts) {
        if (count <= rows.size() / 2) continue;
        for (const Row& row : rows) {
            const Value stored = valueOf(row);
            if (stored.bits == common) continue;
            const Value found = {stored.form, common, {}};
            report.add({row.file, rule, stored, found, stored.shown() + ", most files have " + found.shown()});
        }
        return;
    }
    if (!rows.empty()) report.notCompared(std::string(rule) + ": no value that most files have");
}

}  // namespace

bool checkKind(const StoreFile& file, const tool::ISCSIEPFile& content, Report& report) {
    const FileKind* byType = kindByType(content.head0Type);
    if (file.kind == nullptr) {
        report.notCompared("kind: the file's name tells none", file.path);
        return true;
    }
    if (file.kind == byType || (file.kind->type == 0 && byType == nullptr)) return true;
    const std::string type = "type " + std::to_string(content.head0Type);
    report.add({file.path, "kind", Value::number(content.head0Type), Value::text(file.kind->name),
                type + (byType == nullptr ? "" : std::string(", a ") + byType->title) + ", but named like a " +
                    file.kind->title});
    return false;
}

void checkDataStart(const StoreFile& file, const tool::ISCSIEPFile& content, Report& report) {
    const Value stored = Value::hexadecimal(content.head0DataStartOffset);
    if (content.head0DataStartOffset < tool::EP_HEADER_BLOCK_SIZE) {
        report.add(
            {file.path, "data-start", stored, Value::number(tool::EP_HEADER_BLOCK_SIZE),
             stored.shown() + ", inside the header block of " + std::to_string(tool::EP_HEADER_BLOCK_SIZE) + " bytes"});
    } else if (content.head0DataStartOffset > file.size) {
        report.add(
            {file.path, "data-start", stored, Value::number(file.size),
             stored.shown() + ", behind the end of the file, which has " + std::to_string(file.size) + " bytes"});
    }
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
        rows_, "magic", [](const Row& row) { return Value::hexadecimal(row.magic); }, report);
}

void CommonValues::checkVersion(Report& report) const {
    checkAgainstMost(
        rows_, "version", [](const Row& row) { return Value::number(row.version); }, report);
}

}  // namespace epinspect
