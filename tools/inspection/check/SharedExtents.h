// The rule `shared-extents`: no extent is used by more than one map entry.
#pragma once

#include <ISCSIEPFileMAP.h>

#include <cstdint>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include "check/Report.h"
#include "map/MapRuns.h"
#include "store/ExtentSet.h"
#include "store/Store.h"

namespace inspection {

/// Learns from one walk of all maps which extents of each volume are used more than once; finds out in a second walk
/// who uses these, and keeps nothing else. An extent is named by pool and address together, the lowest 60 bits of an
/// entry, so it does not matter where they are divided. The first walk looks at addresses alone.
class SharedExtents {
public:
    SharedExtents(Context& context, Report& report) : context_(context), report_(report) {}

    /// The runs that come next are those of a map. `volume` tells volumes apart.
    void beginMap(const std::string& volume, const StoreFile& file, const ISCSI::TOOL::ISCSIEPFileMAP& content);

    void add(const MapRun& run);

    /// No more maps come: walks again those of volumes where extents are shared, and reports what it finds.
    void check();

private:
    struct Volume {
        explicit Volume(ExtentMemory& memory) : used(memory), shared(memory) {}
        ExtentSet used;
        ExtentSet shared;  ///< addresses used more than once
        ExtentAdder adder = {used, &shared};
        std::vector<std::uint32_t> maps;  ///< in their order
    };

    struct Map {
        std::string path;
        std::string hostPath;
        std::string uuid;
        std::string parentUUID;
    };

    /// Entries that follow one another and use shared extents.
    struct Use {
        std::uint64_t bits;   ///< of the first entry, as stored
        std::uint64_t first;  ///< its index
        std::uint32_t count;
        std::uint32_t map;

        std::uint64_t extent() const;  ///< pool and address
        std::uint64_t end() const { return extent() + count; }
    };
    using Uses = std::vector<Use>;

    /// Extents from `start` to before `end` that `owner`, the first entry that uses them, shares with `other`.
    struct Piece {
        const Use& owner;
        const Use& other;
        std::uint64_t start;
        std::uint64_t end;
    };

    /// Of the maps of an owner and of another: how many entries share, and whether all are the same in both maps.
    struct Pair {
        std::uint64_t entries = 0;
        bool alike = true;
    };
    using Pairs = std::map<std::pair<std::uint32_t, std::uint32_t>, Pair>;

    void checkVolume(Volume& volume);
    void append(Uses& uses, const Use& use);
    bool collect(Volume& volume, std::uint32_t map, Uses& uses);
    static bool isParent(const Map& one, const Map& other);
    void reportPiece(const Piece& piece, bool alike);
    void giveUp();

    template <typename Each>
    static void sweep(const Uses& uses, Each&& each);

    Context& context_;
    Report& report_;
    ExtentMemory memory_;
    std::vector<Map> maps_;
    std::map<std::string, Volume> volumes_;
    Volume* current_ = nullptr;
    bool haveAll_ = true;  ///< memory holds all extents so far
};

}  // namespace inspection
