#include "store/ExtentPlace.h"

#include <algorithm>

namespace inspection {

namespace {

constexpr std::uint64_t limit = std::uint64_t{1} << 63U;  ///< of positions, in files as on volumes
constexpr std::uint64_t dataFileSize = ISCSI::TOOL::EP_DAT_FILE_SPAN;

std::string named(const ExtentAddress& address) {
    return "extent " + std::to_string(address.extent) + " of pool " + std::to_string(address.pool);
}

}  // namespace

Typed<std::uint32_t> extentSizeIn(std::string_view text) {
    const auto size = sizeIn(text, most32Bits);
    if (size.fault != nullptr) return size.fault;
    if (size.value == 0) return "must not be 0";
    return static_cast<std::uint32_t>(size.value);
}

Typed<AddressBits> addressBitsIn(std::string_view text) {
    const auto bits = numberIn(text, most64Bits);
    if (bits.fault != nullptr) return bits.fault;
    if (bits.value == 48) return AddressBits::bits48;
    if (bits.value == 52) return AddressBits::bits52;
    return "not 48 or 52";
}

Typed<CountFrom> countFromIn(std::string_view text) {
    if (text == "file") return CountFrom::file;
    if (text == "volume") return CountFrom::volume;
    return "not file or volume";
}

std::optional<std::uint64_t> extentAddressOf(const MapEntry& entry, const PlaceChoice& choice) {
    if (isAmbiguous(entry) && !choice.addressBits) return std::nullopt;
    return isAmbiguous(entry) ? readAs(entry, *choice.addressBits).extent : entry.extentAddress;
}

std::string ambiguousAddressText(const MapEntry& entry) {
    return "bits 48 to 51 are set: " + named(readAs(entry, AddressBits::bits48)) + " with --address-bits 48, " +
           named(readAs(entry, AddressBits::bits52)) + " with --address-bits 52";
}

std::optional<ExtentPlace> placeOf(std::uint64_t extentAddress, std::uint32_t extentSize) {
    if (extentSize == 0 || extentAddress >= limit / extentSize) return std::nullopt;
    const std::uint64_t number = extentAddress * extentSize / dataFileSize;
    return ExtentPlace{number, extentAddress - firstExtentOf(number, extentSize), extentAddress,
                       std::min(firstExtentOf(number + 1, extentSize), limit / extentSize)};
}

std::uint64_t firstExtentOf(std::uint64_t number, std::uint32_t extentSize) {
    const std::uint64_t start = number * dataFileSize;
    return start / extentSize + (start % extentSize > 0 ? 1 : 0);
}

std::optional<std::uint64_t> positionOf(std::uint64_t dataStart, std::uint64_t extent, std::uint32_t extentSize,
                                        std::uint32_t offset) {
    if (extentSize == 0 || extent >= limit / extentSize) return std::nullopt;
    const std::uint64_t inData = extent * extentSize + offset;
    if (dataStart >= limit || inData >= limit - dataStart) return std::nullopt;
    return dataStart + inData;
}

std::optional<CountFrom> countingOf(const ExtentPlace& place, std::uint32_t extentSize, std::uint64_t offset,
                                    std::uint64_t dataSize, const PlaceChoice& choice) {
    if (choice.countFrom || place.inFile == place.inVolume) return choice.countFrom.value_or(CountFrom::file);
    // Counted from the volume's start, an extent lies further on: if that place is inside the file, both are.
    if (place.inVolume * extentSize + offset < dataSize) return std::nullopt;
    return CountFrom::file;
}

}  // namespace inspection
