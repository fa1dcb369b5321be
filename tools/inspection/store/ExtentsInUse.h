// Who uses the extents of a volume: of each map how many, and how many no other map uses; of each data file how many
// are in use.
#pragma once

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "map/MapRuns.h"
#include "store/DataFiles.h"
#include "store/ExtentPlace.h"
#include "store/ExtentSet.h"
#include "store/Volumes.h"

namespace inspection {

struct MapUse {
    const VolumeMap* map;
    bool read = false;  ///< all of it; the figures mean nothing if not
    std::uint64_t entries = 0;
    std::uint64_t mapped = 0;
    std::uint64_t ambiguous = 0;  ///< mapped entries whose extent is undecided: they count no further
    std::uint64_t extents = 0;    ///< different ones
    std::uint64_t shared = 0;     ///< of these, used by other maps too

    std::uint64_t alone() const { return extents - shared; }
};

struct DataFileUse {
    std::string path;
    std::optional<std::uint64_t> extents;  ///< that it holds; nothing when that is not known
    std::uint64_t used = 0;                ///< of these, or of all that it should hold where that is not known
    std::uint64_t shared = 0;              ///< of those in use, used by more than one map
    std::uint64_t beyond = 0;              ///< in use, but past its end
    std::uint64_t firstExtent = 0;         ///< the extent address of its first one

    std::uint64_t unclaimed() const { return extents ? *extents - used : 0; }
};

/// The maps of one volume whose extents have one size. Extents are told apart by the extent address alone, as data
/// files hold them.
class ExtentsInUse {
public:
    /// `extentSize`: those of that size; nothing: those of unknown size, whose data files are not looked at.
    ExtentsInUse(Context& context, const Volume& volume, std::optional<std::uint32_t> extentSize,
                 std::optional<AddressBits> addressBits);

    /// Counts, once. False, and a failure, when memory cannot hold what is in use.
    bool count();

    const Volume& volume() const { return volume_; }
    std::optional<std::uint32_t> extentSize() const { return extentSize_; }
    const std::vector<MapUse>& maps() const { return maps_; }
    const std::vector<DataFileUse>& dataFiles() const { return dataFileUses_; }

    /// The extents that are used, and that more than one map uses.
    const ExtentSet& used() const { return used_; }
    const ExtentSet& shared() const { return shared_; }

    /// Different extents that the maps which were asked for use, and of these, those that more than one map uses.
    std::uint64_t askedExtents() const { return allAsked_ ? used_.size() : asked_.size(); }
    std::uint64_t askedShared() const;

    /// Whether maps of the volume have other extent sizes, whose extents are counted apart.
    bool hasOtherSizes() const { return otherSizes_; }

    /// Whether all maps could be read. If not, extents may be used, or be shared, that do not count as such.
    bool isComplete() const { return complete_; }

private:
    /// By number.
    using Rows = std::map<std::uint64_t, DataFileUse>;

    void countMaps();
    void countMap(std::size_t map);
    void addExtents(const MapRun& run, ExtentAdder& adder) const;
    std::uint64_t countShared(std::size_t map);
    void countDataFiles();
    DataFileUse& rowAt(Rows& rows, DataFiles& files, std::uint64_t number);
    void addUse(Rows& rows, DataFiles& files, std::uint64_t first, std::uint64_t count, bool isShared);

    Context& context_;
    const Volume& volume_;
    std::optional<std::uint32_t> extentSize_;
    PlaceChoice choice_;
    bool complete_;
    ExtentMemory memory_;
    ExtentSet used_;
    ExtentSet shared_;
    ExtentSet asked_;  ///< used by maps that were asked for, where others were not
    bool allAsked_ = true;
    bool otherSizes_ = false;
    std::vector<MapUse> maps_;
    std::vector<std::unique_ptr<ExtentSet>> kept_;  ///< the extents of each map; null where memory did not last for it
    std::vector<DataFileUse> dataFileUses_;
    std::uint64_t withoutPlace_ = 0;  ///< extents in use that no data file can hold
};

}  // namespace inspection
