// What locate and read have in common: the LUN, and the options that settle how its bytes are placed.
#pragma once

#include <cstdint>
#include <optional>

#include "CommandLine.h"
#include "store/ExtentPlace.h"
#include "store/LunMap.h"

namespace epinspect {

struct PlaceOptions {
    LunName lun;
    std::optional<std::uint32_t> extentSize;
    PlaceChoice choice;
};

void addLunArgument(Command& command, PlaceOptions& options);
void addPlaceOptions(Command& command, PlaceOptions& options);

}  // namespace epinspect
