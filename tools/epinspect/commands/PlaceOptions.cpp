#include "commands/PlaceOptions.h"

#include "frame/Numbers.h"

namespace epinspect {

namespace {

AddressBits parseAddressBits(const std::string& text) { return meant(addressBitsIn(text)); }
CountFrom parseCountFrom(const std::string& text) { return meant(countFromIn(text)); }
LunName parseLunName(const std::string& text) { return meant(lunNameIn(text)); }

}  // namespace

std::optional<LunMap> openLun(Session& session, const PlaceOptions& options) {
    if (!options.lun.lid && !options.extentSize) {
        throw UsageError{"--extent-size is missing: a map file does not hold it"};
    }
    return openLunMap(session, options.lun, options.extentSize);
}

void addLunArgument(Command& command, PlaceOptions& options) {
    command.argument("LUN", "LUN id, or the path of a map file (then --extent-size is needed)", options.lun,
                     parseLunName);
}

void addPlaceOptions(Command& command, PlaceOptions& options) {
    command
        .option("--extent-size", "SIZE",
                "Bytes of an extent (default: as configured); K, M, G or KiB, MiB, GiB may "
                "follow",
                options.extentSize, parseSize32)
        .option("--address-bits", "48|52",
                "How many bits of an entry are its extent address; matters where bits 48 to "
                "51 are set",
                options.choice.addressBits, parseAddressBits)
        .option("--count-from", "file|volume",
                "From where extents are counted: within the data file, or from the "
                "volume's start",
                options.choice.countFrom, parseCountFrom);
}

}  // namespace epinspect
