#include "commands/MapArguments.h"

#include "frame/Numbers.h"
#include "store/ExtentPlace.h"

namespace epinspect {

LunName parseMap(const std::string& text) { return meant(lunNameIn(text)); }

std::uint32_t parseExtentSize(const std::string& text) { return meant(extentSizeIn(text)); }

void addMapArgument(Command& command, LunName& map) {
    command.argument("MAP", "LUN id, or the path of a map file", map, parseMap);
}

void addLunsOption(Command& command, Lids& lids) {
    const auto parse = [](const std::string& text) {
        const Range range = parseRange32(text);
        return Lids{range.first, range.last};
    };
    command.option("--luns", "FIRST-LAST", "LUN ids to look for in the configuration (default: 0-255)", lids, parse);
}

}  // namespace epinspect
