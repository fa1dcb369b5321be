// How a map, LUN ids to be tried and the size of extents are typed, in every subcommand alike.
#pragma once

#include "frame/CommandLine.h"
#include "frame/Inspection.h"
#include "store/NamedMap.h"

namespace epinspect {

/// MAP: a LUN id, or the path of a map file. Like the next one throws UsageError.
LunName parseMap(const std::string& text);

/// SIZE: the bytes of an extent, not 0.
std::uint32_t parseExtentSize(const std::string& text);

void addMapArgument(Command& command, LunName& map);

/// --luns FIRST-LAST.
void addLunsOption(Command& command, Lids& lids);

}  // namespace epinspect
