// The bytes of a LUN, as its map puts them together.
#pragma once

#include <cstdint>
#include <functional>
#include <memory>
#include <string>
#include <vector>

#include "map/MapRuns.h"
#include "store/Context.h"
#include "store/DataFiles.h"
#include "store/ExtentPlace.h"
#include "store/LunMap.h"

namespace inspection {

/// Hands out the bytes of a LUN in constant memory: zeros for what is not mapped, and for what cannot be read, which is
/// reported.
class LunReader {
public:
    using Write = std::function<void(const unsigned char* bytes, std::size_t length)>;

    /// Will hand `length` bytes from `first` on, all of them inside the LUN, to `write`, which may throw.
    LunReader(Context& context, const LunMap& lun, const PlaceChoice& choice, std::uint64_t first, std::uint64_t length,
              Write write);

    /// Once. Returns how many bytes could not be read. Throws what `write` throws, after all failures are reported.
    std::uint64_t run();

private:
    /// The system copies fastest to where a page starts.
    struct alignas(4096) Page {
        unsigned char bytes[4096];
    };

    void handMap(std::uint64_t end);
    void handRun(const MapRun& run);
    void handExtents(const ExtentPlace& place, std::uint64_t offset, std::uint64_t length);
    void copy(const DataFile& data, std::uint64_t position, std::uint64_t length);
    void copyPiece(const DataFile& data, std::uint64_t position, std::uint32_t length);
    void handZeros(std::uint64_t length);
    void handBytes(const unsigned char* bytes, std::size_t length);

    /// Zeros in the place of `length` bytes. The subject of the failure is a file, or none: the LUN as a whole.
    void miss(std::uint64_t length, const Failure& failure);
    void reportMissing();

    Context& context_;
    const LunMap& lun_;
    PlaceChoice choice_;
    DataFiles files_;
    Write write_;
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

}  // namespace inspection
