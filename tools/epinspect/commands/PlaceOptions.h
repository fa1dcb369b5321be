// What locate and read have in common: the map of a LUN, and the options that decide where its bytes lie.
#pragma once

#include <cstdint>
#include <optional>

#include "frame/CommandLine.h"
#include "frame/Session.h"
#include "store/ExtentPlace.h"
#include "store/LunMap.h"

namespace epinspect {

struct PlaceOptions {
    LunName map;
    std::optional<std::uint32_t> extentSize;
    PlaceChoice choice;
};

/// --address-bits 48|52.
void addAddressBitsOption(Command& command, std::optional<AddressBits>& bits);

/// Those of PLACE.
void addPlaceOptions(Command& command, std::optional<std::uint32_t>& extentSize, PlaceChoice& choice);

}  // namespace epinspect
