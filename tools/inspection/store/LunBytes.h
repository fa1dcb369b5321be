// The bytes of a LUN, as its map puts them together.
#pragma once

#include <cstdint>
#include <functional>
#include <optional>
#include <vector>

#include "map/MapRuns.h"
#include "store/Context.h"
#include "store/DataFiles.h"
#include "store/ExtentPlace.h"
#include "store/LunMap.h"

namespace inspection {

/// Neighbouring bytes of a LUN that are alike.
struct LunPart {
    enum class Kind {
        data,       ///< lie together in a data file
        hole,       ///< not mapped: they read as zeros
        unreadable  ///< cannot be read, or their place is ambiguous
    };

    Kind kind;
    std::uint64_t offset;  ///< in the LUN
    std::uint64_t length;
    std::uint64_t dataFile = 0;  ///< of data: the number of the data file,
    std::uint64_t position = 0;  ///< and where they start in it, counted from its data start offset
    Failure failure = {};        ///< of what is unreadable: why, and the file to blame if it is one file

    std::uint64_t end() const { return offset + length; }

    /// `count` bytes of what is data, from byte `start` of it on.
    LunPart dataIn(std::uint64_t start, std::uint64_t count) const {
        return {kind, offset + start, count, dataFile, position + start};
    }

    /// Whether `next` starts where this ends, in the LUN and in the data file, and is alike.
    bool continuesWith(const LunPart& next) const;
};

/// Reads a LUN in constant memory. No file is held open, so each call sees the files as they are then. A failure
/// concerns only the bytes that cannot be read. Used by one thread at a time; each thread needs a Context and a LunMap
/// of its own.
class LunBytes {
public:
    /// Takes parts in their order; returns whether to go on.
    using Each = std::function<bool(const LunPart&)>;

    /// `lun` must live as long as this.
    LunBytes(Context& context, const LunMap& lun, const PlaceChoice& choice);

    /// Calls each() for the parts of the `length` bytes from `offset` on, which lie inside the LUN. These follow from
    /// the map and from the sizes of the data files; no byte of the LUN is read. Neighbouring parts may be alike.
    void forEachPart(std::uint64_t offset, std::uint64_t length, const Each& each);

    /// Reads the bytes of `part`, which is data of less than 1 GiB, into `bytes`, and calls missing() for what cannot
    /// be read: zeros stand in its place. Returns false when missing() did.
    bool readData(const LunPart& part, unsigned char* bytes, const Each& missing);

    /// Reads `length` bytes from `offset` on, which lie inside the LUN and are less than 1 GiB, into `bytes`: zeros for
    /// holes, and for what is unreadable, for which missing() is called. Returns false when missing() did.
    bool read(std::uint64_t offset, std::uint64_t length, unsigned char* bytes, const Each& missing);

    /// Tells the context which files have changed since they were opened.
    void noticeChanges() const;

    /// The failure of a part that is unreadable, as messages say it.
    Failure failureOf(const LunPart& part) const;

private:
    class Parts;

    int readEntries(std::uint64_t first, std::uint64_t last, std::vector<MapEntry>& entries);
    bool addRun(Parts& parts, const MapRun& run);
    bool addExtents(Parts& parts, const ExtentPlace& place, std::uint64_t offset, std::uint64_t length);
    bool readPiece(const LunPart& part, unsigned char* bytes, const Each& missing);
    bool readRest(const LunPart& part, unsigned char* bytes, const Each& missing);

    const LunMap& lun_;
    PlaceChoice choice_;
    DataFiles files_;
};

}  // namespace inspection
