// The rule `shared-extents`: no extent is used by more than one map entry.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <vector>

#include "check/Report.h"
#include "map/MapRuns.h"

namespace inspection {

/// Collects runs of mapped entries, 24 bytes each, then sorts them once and sweeps once. What is compared is the lowest
/// 60 bits of entries of one volume, so it does not matter where they are divided.
class SharedExtents {
public:
    /// The runs that come next are from the map `file`; `volume` tells volumes apart.
    void beginMap(const std::string& volume, const std::string& file);

    void add(const MapRun& run);

    /// Whether memory could hold all runs. If not, there is nothing to be checked.
    bool haveAll() const { return haveAll_; }

    void check(Report& report);

private:
    struct Use {
        std::uint64_t extent;
        std::uint64_t first;
        std::uint32_t count;
        std::uint32_t map;

        std::uint64_t end() const { return extent + count; }
    };
    using Uses = std::vector<Use>;

    void append(const Use& use);
    void sweep(const Uses& uses, Report& report) const;
    void reportShared(const Use& earlier, const Use& later, Report& report) const;

    std::vector<std::string> files_;
    std::map<std::string, Uses> volumes_;
    Uses* current_ = nullptr;
    bool haveAll_ = true;
};

}  // namespace inspection
