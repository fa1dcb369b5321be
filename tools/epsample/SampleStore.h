// A LUN store to try the tools on, in which everything fits together; the same at each run.
#pragma once

#include <cstdint>
#include <string>

namespace epsample {

/// The most entries that the map file of LUN 1 can have.
inline constexpr std::uint64_t mostMapEntries = std::uint64_t{1} << 32U;

/// Writes the store below the empty folder `root`, each file where it would lie below "/": journal and LUN list; of
/// volume 1 LUN 1, whose map file has `mapEntries` entries, with as many sparse data files as that takes, and LUN 3,
/// which shares extents with it as a snapshot does; of volume 2 the small LUN 2. Throws std::system_error.
void writeSampleStore(const std::string& root, std::uint64_t mapEntries);

}  // namespace epsample
