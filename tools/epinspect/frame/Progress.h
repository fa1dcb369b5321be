// A sign of life during long work.
#pragma once

#include <chrono>
#include <cstdint>

#include "frame/StatusLine.h"

namespace epinspect {

/// Shows on standard error how far a work has come and how long it will still take, when that is a terminal and more
/// than a second has passed. One at a time.
class Progress {
public:
    /// What goes to standard output meanwhile.
    enum class Beside { nothing, listing };

    /// `total` of `things` will be done. Shows nothing while a listing runs on a terminal.
    Progress(const char* things, std::uint64_t total, Beside beside);
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;
    ~Progress() { eraseStatusLine(); }

    void show(std::uint64_t done);

    /// Whether this is the progress of just that.
    bool isOf(const char* things, std::uint64_t total) const { return things_ == things && total_ == total; }

private:
    using Clock = std::chrono::steady_clock;

    const char* things_;
    std::uint64_t total_;
    bool wanted_;
    Clock::time_point start_ = Clock::now();
    Clock::time_point due_;
};

}  // namespace epinspect
