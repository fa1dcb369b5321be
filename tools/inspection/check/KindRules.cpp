#include "check/KindRules.h"

#include <algorithm>

namespace inspection {

namespace {

/// `file` has the type of `other`, which is of another kind; or another type than `other`, which is of its kind.
Finding findingOf(const std::string& file, const KindDoubt& doubt, const Value& found, const std::string& other) {
    Finding finding = {file, Rule::kind, Value::number(doubt.type), found};
    finding.kinds = doubt;
    finding.partner = Finding::Partner{other, 0};
    return finding;
}

}  // namespace

void KindTypes::add(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFile& content) {
    // checkKind() knows the others.
    if (file.kind == nullptr || file.kind->type != 0 || kindByType(content.head0Type) != nullptr) return;
    rows_.push_back({file.path, file.kind, content.head0Type});
    ++files_[file.kind];
    ++filesByType_[content.head0Type][file.kind];
}

std::set<std::string> KindTypes::check(Report& report) const {
    std::set<std::string> wrong;
    std::map<const FileKind*, Rows> kinds;
    for (const Row& row : rows_) {
        const Row* like = findLike(row);
        if (like == nullptr) {
            kinds[row.kind].push_back(row);
        } else {
            const KindDoubt doubt = {row.kind, row.type, like->kind};
            report.add(findingOf(row.file, doubt, Value::text(row.kind->name), like->file));
            wrong.insert(row.file);
        }
    }
    for (const auto& [kind, rows] : kinds) {
        std::map<std::uint32_t, std::size_t> counts;
        for (const Row& row : rows) ++counts[row.type];
        for (const Row& row : rows) {
            const auto other = std::find_if(rows.begin(), rows.end(), [&](const Row& each) {
                return each.type != row.type && counts[each.type] >= counts[row.type];
            });
            if (other == rows.end()) continue;
            report.add(findingOf(row.file, {kind, row.type, nullptr}, Value::number(other->type), other->file));
            wrong.insert(row.file);
        }
    }
    return wrong;
}

/// The kind to which `type` belongs: the one of which a larger share of files has it or, where the shares are equal,
/// more files. Null where that does not decide.
const FileKind* KindTypes::ownerOf(std::uint32_t type) const {
    const FileKind* owner = nullptr;
    std::uint64_t most = 0;
    bool decided = false;
    for (const auto& [kind, count] : filesByType_.at(type)) {
        const std::uint64_t share = count * (owner != nullptr ? files_.at(owner) : 1);
        const std::uint64_t best = most * files_.at(kind);
        if (share == best && count == most) {
            decided = false;
        } else if (share > best || (share == best && count > most)) {
            owner = kind;
            most = count;
            decided = true;
        }
    }
    return decided ? owner : nullptr;
}

/// A file of another kind to which the type of `row` belongs; null when it belongs to the kind of `row`.
const KindTypes::Row* KindTypes::findLike(const Row& row) const {
    const FileKind* owner = ownerOf(row.type);
    if (owner == row.kind) return nullptr;
    for (const Row& other : rows_) {
        if (other.type == row.type && other.kind != row.kind && (owner == nullptr || other.kind == owner))
            return &other;
    }
    return nullptr;
}

}  // namespace inspection
