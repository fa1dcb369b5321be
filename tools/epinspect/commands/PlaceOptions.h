// What locate and read have in common: the LUN, and the options that settle how its bytes are placed.
#pragma once

#include <cstdint>
#include <optional>

#include "frame/CommandLine.h"
#include "frame/Session.h"
#include "store/ExtentPlace.h"
#include "store/LunMap.h"

namespace epinspect {

struct PlaceOptions {
    LunName lun;
    std::optional<std::uint32_t> extentSize;
    PlaceChoice choice;
};

/// Opens the map of the LUN; reports what fails. Throws UsageError.
std::optional<LunMap> openLun(Session& session, const PlaceOptions& options);

void addLunArgument(Command& command, PlaceOptions& options);
void addPlaceOptions(Command& command, PlaceOptions& options);

}  // namespace epinspect
