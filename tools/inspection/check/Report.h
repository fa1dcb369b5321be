// The result of a check: findings, totals, and what could not be compared.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <string>
#include <tuple>
#include <unordered_map>
#include <utility>
#include <vector>

#include "check/Finding.h"
#include "store/ChangeWatch.h"
#include "store/Context.h"

namespace inspection {

/// A map that shares extents with the map which it names as its parent, each at the same entry with the same content:
/// as a snapshot does, and no finding.
struct Snapshot {
    std::string file;
    std::string parent;
    std::uint64_t entries;
    std::optional<std::uint32_t> lid = {};
    std::optional<std::uint32_t> parentLid = {};
};

/// Hands findings to `take`, in the order of their files. Joins those about entries that break one rule against one
/// partner, unless `each` run is to be seen.
class Report {
public:
    Report(Context& context, bool each, std::function<void(const Finding&)> take)
        : context_(context), each_(each), take_(std::move(take)) {}

    /// Findings about the file `path` may come from now on; it is the map of the LUN `lid`, where that is known, and
    /// `watch` knows whether it changes.
    void beginFile(const std::string& path, std::optional<std::uint32_t> lid, const ChangeWatch& watch);

    /// Whether the file `path`, about which findings may come, has changed since beginFile(); tells the context.
    bool hasChanged(const std::string& path) const;

    void add(Finding finding);

    /// Hands out what was added.
    void handOut();

    /// Remembers that `what` could not be compared, and in which file, where that concerns one.
    void notCompared(const std::string& what, const std::string& file = {});

    void addSnapshot(Snapshot snapshot);
    const std::vector<Snapshot>& snapshots() const { return snapshots_; }

    /// Counts a file that has been read, and the entries of a map.
    void countFile() { ++files_; }
    void countEntries(std::uint64_t count) { entries_ += count; }

    std::uint64_t files() const { return files_; }
    std::uint64_t entries() const { return entries_; }

    /// How many findings were handed out, by rule.
    const std::map<Rule, std::uint64_t>& findings() const { return findings_; }

    /// What could not be compared, and why: one text for each.
    std::vector<std::string> gaps() const;

private:
    struct File {
        std::size_t rank;  ///< files come in this order
        std::optional<std::uint32_t> lid;
        ChangeWatch watch;
    };

    struct Files {
        std::uint64_t count = 0;
        std::string first;
    };

    /// What joined findings have in common: file, rule, other file, data file.
    using Group = std::tuple<std::string, Rule, std::string, std::uint64_t>;

    void askForChanges() const;
    std::optional<std::uint32_t> lidOf(const std::string& path) const;
    void complete(Finding& finding) const;
    std::pair<std::size_t, std::size_t> rankOf(const Finding& finding) const;

    Context& context_;
    bool each_;
    std::function<void(const Finding&)> take_;
    std::unordered_map<std::string, File> known_;  ///< files, by path
    std::vector<Finding> waiting_;
    std::map<Group, std::size_t> groups_;  ///< those that are waiting
    std::uint64_t files_ = 0;
    std::uint64_t entries_ = 0;
    std::map<Rule, std::uint64_t> findings_;
    std::map<std::string, Files> notCompared_;
    std::vector<Snapshot> snapshots_;
};

}  // namespace inspection
