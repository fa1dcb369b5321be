// Whose bytes lie at positions of a data file: the reverse of the place of an extent.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <optional>
#include <vector>

#include "Range.h"
#include "map/MapRuns.h"
#include "store/DataFiles.h"
#include "store/ExtentPlace.h"
#include "store/ExtentSet.h"
#include "store/Volumes.h"

namespace inspection {

/// Entries of a map that follow one another, and whose extents lie one after the other in the data file.
struct Owner {
    const VolumeMap* map;
    CountFrom countFrom;     ///< the way of counting by which they lie there
    std::uint64_t start;     ///< of the first extent, in bytes after the data start
    std::uint64_t count;     ///< of entries
    std::uint64_t index;     ///< of the first entry
    MapEntry entry;          ///< the first one
    bool undecided = false;  ///< by the other way of counting they would lie inside the data file too

    std::uint64_t end() const { return start + count * *map->extentSize; }
};

/// Neighbouring positions that the same entries own, or that none does.
struct OwnedRange {
    enum class Where { header, extent, pastEnd };

    Where where;
    std::uint64_t position;
    std::uint64_t length;
    std::vector<Owner> owners = {};  ///< from the entries of the first position on
};

class Owners {
public:
    /// Of positions in the data file `number` of a volume, which is `data` and can be read. `choice` settles what the
    /// format leaves undecided, as far as it goes.
    Owners(Context& context, const Volume& volume, const DataFile& data, std::uint64_t number,
           const PlaceChoice& choice);

    /// Walks the maps of the volume, once for all positions that will be asked for, which are below 2^63. Reports what
    /// cannot be read, and entries whose ambiguous bits decide whether they are owners. False, and a failure, when
    /// memory cannot hold what is found.
    bool find(const std::vector<Range>& positions);

    /// Calls each(part) for the parts of one of these, in their order. Past the end of the file there are owners too:
    /// of extents that should lie there.
    void forEachPart(const Range& positions, const std::function<void(const OwnedRange&)>& each) const;

    /// Whether all maps could be read. If not, there may be more owners.
    bool isComplete() const { return complete_; }

private:
    /// Neighbouring bytes after the data start that are asked for.
    struct Target {
        Range bytes;
        std::vector<Owner> owners;  ///< in the order of their starts
    };

    /// Extent addresses that lie in a target by one way of counting.
    struct Wanted {
        Range extents;
        std::size_t target;
    };

    /// Those of one extent size, by way of counting, in their order.
    struct Way {
        CountFrom countFrom;
        std::uint64_t firstExtent;  ///< the address of the one that starts at the data start
        std::vector<Wanted> wanted;
    };

    void setTargets(const std::vector<Range>& positions);
    std::vector<Way> waysFor(std::uint32_t extentSize) const;
    void walk(const VolumeMap& map);
    void take(const VolumeMap& map, const std::vector<Way>& ways, const MapRun& run, std::uint64_t address);
    bool reportAmbiguous(const VolumeMap& map, const std::vector<Way>& ways, const MapRun& run, AddressBits bits);
    std::uint64_t undecidedBefore(const Owner& owner) const;
    void addParts(const Target& target, Range bytes, const std::function<void(const OwnedRange&)>& each) const;

    Context& context_;
    const Volume& volume_;
    const DataFile& data_;
    std::uint64_t number_;
    PlaceChoice choice_;
    bool complete_;
    ExtentMemory memory_;
    std::vector<Target> targets_;  ///< in their order
};

}  // namespace inspection
