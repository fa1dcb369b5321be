#include "commands/PlaceOptions.h"

#include "commands/MapArguments.h"
#include "frame/Numbers.h"

namespace epinspect {

namespace {

AddressBits parseAddressBits(const std::string& text) { return meant(addressBitsIn(text)); }
CountFrom parseCountFrom(const std::string& text) { return meant(countFromIn(text)); }

}  // namespace

void addAddressBitsOption(Command& command, std::optional<AddressBits>& bits) {
    command.option("--address-bits", "48|52",
                   "How many bits of an entry are its extent address; matters where bits 48 to 51 are set", bits,
                   parseAddressBits);
}

void addPlaceOptions(Command& command, std::optional<std::uint32_t>& extentSize, PlaceChoice& choice) {
    command.option("--extent-size", "SIZE",
                   "Bytes of an extent (default: as configured); K, M, G or KiB, MiB, GiB may follow", extentSize,
                   parseExtentSize);
    addAddressBitsOption(command, choice.addressBits);
    command.option("--count-from", "file|volume",
                   "From where extents are counted: within the data file, or from the volume's start", choice.countFrom,
                   parseCountFrom);
}

}  // namespace epinspect
