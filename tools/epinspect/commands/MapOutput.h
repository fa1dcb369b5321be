// How entries and runs are written.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "frame/Inspection.h"
#include "frame/Json.h"
#include "frame/LineBuffer.h"
#include "map/MapRuns.h"

namespace epinspect {

/// How the LUNs of a map are named: "LUN 1", or "LUNs 1, 4" where they have one map file.
std::string lunsText(const std::vector<std::uint32_t>& lids);

/// Appends "FIRST-LAST", or the one number when both are the same.
void writeRange(LineBuffer& text, std::uint64_t first, std::uint64_t count);

/// Appends what a run of `count` entries holds, of which `entry` is the first: "hole", or flags, pool and extents.
void writeEntries(LineBuffer& text, const MapEntry& entry, std::uint64_t count);

/// Appends the line of a run.
void writeRun(LineBuffer& text, const MapRun& run);

/// Writes the six members of an entry.
void writeMembers(Json& object, const MapEntry& entry);

/// Writes "first", "count", "entryOffset", and "hole" or the members of the first entry.
void writeRun(Json& object, const MapRun& run, std::uint64_t entryOffset);

}  // namespace epinspect
