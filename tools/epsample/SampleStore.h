// A small LUN store to try the tools on, the same at each run.
#pragma once

#include <cstdint>
#include <string>

#include "EPFileBuilder.h"

namespace epsample {

using namespace epbuilder;

/// Bytes of an extent of the sample store.
inline constexpr std::uint32_t extentSize = 1048576;

/// The map entry that the sample store holds for `index`: runs, holes and fragments.
MapEntry sampleEntry(std::uint64_t index);

/// Writes the store below `root`, each file where it would lie below "/": journal, LUN list, table, free-index and two
/// sparse data files of volume 1, and the map file of LUN 1 with `mapEntries` entries. Throws std::system_error.
void writeSampleStore(const std::string& root, std::uint64_t mapEntries);

}  // namespace epsample
