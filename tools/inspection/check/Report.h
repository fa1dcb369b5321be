// What a check amounts to: findings as they come, totals, and what could not be compared.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include "check/Finding.h"

namespace inspection {

class Report {
public:
    /// `take` gets each finding when it is found.
    explicit Report(std::function<void(const Finding&)> take) : take_(std::move(take)) {}

    void add(const Finding& finding) {
        ++findings_;
        take_(finding);
    }

    /// Remembers that `what` could not be compared; where that concerns one file: which one.
    void notCompared(const std::string& what, const std::string& file = {});

    /// Counts a file that has been read, and the entries of a map.
    void countFile() { ++files_; }
    void countEntries(std::uint64_t count) { entries_ += count; }

    std::uint64_t files() const { return files_; }
    std::uint64_t entries() const { return entries_; }
    std::uint64_t findings() const { return findings_; }

    /// What could not be compared and why, a text each.
    std::vector<std::string> gaps() const;

private:
    struct Files {
        std::uint64_t count = 0;
        std::string first;
    };

    std::function<void(const Finding&)> take_;
    std::uint64_t files_ = 0;
    std::uint64_t entries_ = 0;
    std::uint64_t findings_ = 0;
    std::map<std::string, Files> notCompared_;
};

}  // namespace inspection
