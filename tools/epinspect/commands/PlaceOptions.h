// What locate and read have in common: the LUN, and the options that settle how its bytes are placed.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "CommandLine.h"
#include "store/ExtentPlace.h"

namespace epinspect {

struct PlaceOptions {
    std::string lun;
    std::optional<std::uint32_t> extentSize;
    PlaceChoice choice;
};

void addLunArgument(Command& command, PlaceOptions& options);
void addPlaceOptions(Command& command, PlaceOptions& options);

}  // namespace epinspect
