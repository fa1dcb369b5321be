#include "check/SharedExtents.h"

#include <algorithm>
#include <limits>
#include <new>
#include <tuple>

namespace inspection {

void SharedExtents::beginMap(const std::string& volume, const std::string& file) {
    current_ = &volumes_[volume];
    files_.push_back(file);
}

void SharedExtents::add(const MapRun& run) {
    if (!run.entry.mapped || !haveAll_) return;
    constexpr std::uint64_t most = std::numeric_limits<std::uint32_t>::max();
    const auto map = static_cast<std::uint32_t>(files_.size() - 1);
    try {
        for (std::uint64_t done = 0; done < run.count;) {
            const auto count = static_cast<std::uint32_t>(std::min(run.count - done, most));
            append({lowBitsOf(run.entry) + done, run.first + done, count, map});
            done += count;
        }
    } catch (const std::bad_alloc&) {
        haveAll_ = false;
        for (auto& [volume, uses] : volumes_) Uses().swap(uses);
    }
}

void SharedExtents::append(const Use& use) {
    if (!current_->empty()) {
        Use& before = current_->back();
        constexpr auto most = std::numeric_limits<std::uint32_t>::max();
        const bool continues = before.map == use.map && before.end() == use.extent &&
                               before.first + before.count == use.first && before.count <= most - use.count;
        if (continues) {
            before.count += use.count;
            return;
        }
    }
    current_->push_back(use);
}

void SharedExtents::check(Report& report) {
    for (auto& [volume, uses] : volumes_) {
        std::sort(uses.begin(), uses.end(), [](const Use& one, const Use& other) {
            return std::tie(one.extent, one.map, one.first) < std::tie(other.extent, other.map, other.first);
        });
        sweep(uses, report);
    }
}

/// Holds each use against the earlier one that reaches furthest: what it shares with any, it shares with that one.
void SharedExtents::sweep(const Uses& uses, Report& report) const {
    const Use* furthest = nullptr;
    for (const Use& use : uses) {
        if (furthest != nullptr && use.extent < furthest->end()) reportShared(*furthest, use, report);
        if (furthest == nullptr || use.end() > furthest->end()) furthest = &use;
    }
}

void SharedExtents::reportShared(const Use& earlier, const Use& later, Report& report) const {
    const std::uint64_t count = std::min(earlier.end(), later.end()) - later.extent;
    const std::uint64_t otherFirst = earlier.first + (later.extent - earlier.extent);
    const MapEntry entry = mappedEntry(later.extent);
    Finding finding = {files_[later.map], Rule::sharedExtents, Value::number(entry.extentAddress),
                       Value::text(files_[earlier.map])};
    finding.entries = Finding::Entries(later.first, count, entry);
    finding.partner = Finding::Partner{files_[earlier.map], otherFirst};
    report.add(finding);
}

}  // namespace inspection
