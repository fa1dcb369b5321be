// What differs between two maps.
#pragma once

#include <algorithm>
#include <cstdint>
#include <optional>
#include <vector>

#include "map/MapRuns.h"

namespace inspection {

enum class Difference { none, onlyFirst, onlySecond, moved, flags };

inline bool isSame(const MapEntry& a, const MapEntry& b) {
    return a.extentAddress == b.extentAddress && a.poolNumber == b.poolNumber && flagsOf(a) == flagsOf(b);
}

/// How two entries of one index differ. Null stands for an entry past the end of the file, which counts as a hole.
inline Difference differenceOf(const MapEntry* a, const MapEntry* b) {
    const bool inFirst = a != nullptr && !isHole(*a);
    const bool inSecond = b != nullptr && !isHole(*b);
    if (!inFirst || !inSecond) {
        if (inFirst) return Difference::onlyFirst;
        return inSecond ? Difference::onlySecond : Difference::none;
    }
    if (a->extentAddress != b->extentAddress || a->poolNumber != b->poolNumber) return Difference::moved;
    return isSame(*a, *b) ? Difference::none : Difference::flags;
}

/// Neighbouring entries that differ in the same way.
struct DiffRun {
    /// What one of the maps has there.
    struct Side {
        std::optional<MapEntry> entry;  ///< the first one; nothing past the end of the file
        bool isRun = true;              ///< the other entries continue it as one run
    };

    std::uint64_t first = 0;
    std::uint64_t count = 0;
    Difference difference = Difference::none;
    Side a, b;
};

/// Compares the entries of two maps, which come block by block.
class MapDiff {
public:
    /// Takes the entries of both maps from index `first` on; of a map that has ended there are fewer. Calls emit(run)
    /// for every run of differences that ends before the last of these entries.
    template <typename Emit>
    void add(std::uint64_t first, const std::vector<MapEntry>& a, const std::vector<MapEntry>& b, Emit&& emit) {
        const auto both = std::min(a.size(), b.size());
        for (std::size_t i = 0; i < both; ++i) {
            if (!isSame(a[i], b[i])) compare(first + i, &a[i], &b[i], emit);
        }
        for (std::size_t i = both; i < a.size(); ++i) compare(first + i, &a[i], nullptr, emit);
        for (std::size_t i = both; i < b.size(); ++i) compare(first + i, nullptr, &b[i], emit);
    }

    /// No more entries come: calls emit() for the last run.
    template <typename Emit>
    void finish(Emit&& emit) {
        if (run_.count > 0) emit(run_);
        run_.count = 0;
    }

private:
    template <typename Emit>
    void compare(std::uint64_t index, const MapEntry* a, const MapEntry* b, Emit&& emit) {
        const Difference difference = differenceOf(a, b);
        if (difference == Difference::none) return;
        if (run_.difference != difference || run_.first + run_.count != index) finish(emit);
        if (run_.count == 0) run_ = {index, 0, difference, sideOf(a), sideOf(b)};
        extend(run_.a, a);
        extend(run_.b, b);
        ++run_.count;
    }

    static DiffRun::Side sideOf(const MapEntry* entry) {
        return {entry != nullptr ? std::optional(*entry) : std::nullopt, true};
    }

    void extend(DiffRun::Side& side, const MapEntry* next) const {
        if (next != nullptr && side.entry) side.isRun = side.isRun && continues(*side.entry, run_.count, *next);
    }

    DiffRun run_;
};

/// How many entries differ, and in what way.
struct DiffSummary {
    std::uint64_t entries = 0;  ///< of the longer map
    std::uint64_t onlyFirst = 0, onlySecond = 0, moved = 0, flags = 0;

    void add(const DiffRun& run);

    /// How many do not differ.
    std::uint64_t same() const { return entries - onlyFirst - onlySecond - moved - flags; }
};

}  // namespace inspection
