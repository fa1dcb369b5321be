// A sign of life on long walks.
#pragma once

#include <chrono>
#include <cstdint>

namespace epinspect {

/// Shows how far a walk has come on standard error, when that is a terminal and more than a second has passed.
class Progress {
public:
    explicit Progress(const char* what);
    Progress(const Progress&) = delete;
    Progress& operator=(const Progress&) = delete;

    /// Takes the line away again.
    ~Progress();

    void show(std::uint64_t done);

private:
    const char* what_;
    bool terminal_;
    bool shown_ = false;
    std::chrono::steady_clock::time_point due_;
};

}  // namespace epinspect
