#include "commands/PlaceOptions.h"

#include "frame/Numbers.h"

namespace epinspect {

namespace {

AddressBits parseAddressBits(const std::string& text) {
    const std::uint64_t bits = parseNumber(text);
    if (bits == 48) return AddressBits::bits48;
    if (bits == 52) return AddressBits::bits52;
    throw UsageError{"not 48 or 52"};
}

CountFrom parseCountFrom(const std::string& text) {
    if (text == "file") return CountFrom::file;
    if (text == "volume") return CountFrom::volume;
    throw UsageError{"not file or volume"};
}

LunName parseLunName(const std::string& text) {
    const std::string prefix = text.substr(0, 2);
    const bool number = prefix == "0x" || prefix == "0X" ||
                        (!text.empty() && text.find_first_not_of("0123456789") == std::string::npos);
    if (number) return {parseNumber32(text), ""};
    return {std::nullopt, text};
}

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
