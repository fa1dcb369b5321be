// The bytes of a LUN, as its map puts them together.
#pragma once

#include <cstdint>
#include <memory>
#include <string>
#include <vector>

#include "Progress.h"
#include "Session.h"
#include "map/MapRuns.h"
#include "store/DataFiles.h"
#include "store/ExtentPlace.h"
#include "store/LunMap.h"

namespace epinspect {

/// Prints bytes of a LUN in constant memory: zeros for what is not mapped, and for what cannot be read, which is
/// reported.
class LunReader {
public:
    /// Will print `length` bytes from `first` on, all of them inside the LUN.
    LunReader(Session& session, const LunMap& lun, const PlaceChoice& choice, std::uint64_t first,
              std::uint64_t length);

    /// Once. Throws OutputFailure.
    void print();

private:
    /// The system copies fastest to where a page starts.
    struct alignas(4096) Page {
        unsigned char bytes[4096];
    };

    /// Why bytes cannot be read.
    struct Failure {
        std::string file;  ///< empty: the LUN as a whole
        std::string what;  ///< empty: what `error` and `reason` tell
        int error = 0;
        int reason = 0;
    };

    void printMap(std::uint64_t end);
    void printRun(const MapRun& run);
    void printExtents(const ExtentPlace& place, std::uint64_t offset, std::uint64_t length);
    void copy(const DataFile& data, std::uint64_t position, std::uint64_t length);
    void copyPiece(const DataFile& data, std::uint64_t position, std::uint32_t length);
    void printZeros(std::uint64_t length);
    void printBytes(const unsigned char* bytes, std::size_t length);

    /// Zeros in the place of `length` bytes.
    void miss(std::uint64_t length, const Failure& failure);
    void reportMissing();

    Session& session_;
    const LunMap& lun_;
    PlaceChoice choice_;
    DataFiles files_;
    Progress progress_;
    std::unique_ptr<Page[]> buffer_;
    unsigned char* bytes_;
    const std::vector<unsigned char> zeros_;
    const std::uint64_t first_;
    const std::uint64_t end_;
    std::uint64_t at_;               ///< offset in the LUN of the byte that is printed next
    std::uint64_t missing_ = 0;      ///< bytes in all that could not be read
    Failure failure_;                ///< of the missing bytes that are not reported yet
    std::uint64_t missingFrom_ = 0;  ///< these, up to
    std::uint64_t missingTo_ = 0;    ///< but without that one
};

}  // namespace epinspect
