// Where the extent of a map entry lies on its volume: arithmetic alone, no file is opened.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "map/MapRuns.h"

namespace epinspect {

/// How many low bits of a map entry are the extent address; the pool number lies above them.
enum class AddressBits : unsigned int { bits48 = 48, bits52 = 52 };

/// From where extents are counted when one is looked for in its data file.
enum class CountFrom { file, volume };

/// Whether any of bits 48 to 51 is set, of which the format does not tell whether they belong to the extent address or
/// to the pool number.
inline bool hasOpenBits(const MapEntry& entry) { return (entry.poolNumber & 0xFU) != 0; }

/// An entry's low 60 bits, read in one of the two ways.
struct ExtentAddress {
    std::uint64_t extent;
    unsigned int pool;
};

ExtentAddress readAs(const MapEntry& entry, AddressBits bits);

/// What the user chose where the format leaves it open.
struct PlaceChoice {
    std::optional<AddressBits> addressBits;
    std::optional<CountFrom> countFrom;
};

/// The extent address of an entry; nothing when it is open which of two it is, as openAddressText() tells.
std::optional<std::uint64_t> extentAddressOf(const MapEntry& entry, const PlaceChoice& choice);
std::string openAddressText(const MapEntry& entry);

/// The data file of an extent, and the extent's number in it by both ways of counting.
struct ExtentPlace {
    std::uint64_t dataFile;  ///< number of the data file
    std::uint64_t inFile;    ///< counted from the first extent that starts in the data file's 4 TiB of the volume
    std::uint64_t inVolume;  ///< counted from the volume's start: the extent address itself
    std::uint64_t next;      ///< the first extent address of the next data file
};

/// The place of the extent `extentAddress` of `extentSize` bytes; nothing when that is 0 or when the extent would end
/// behind byte 2^63 of the volume.
std::optional<ExtentPlace> placeOf(std::uint64_t extentAddress, std::uint32_t extentSize);

/// The position in a data file of byte `offset` of its extent number `extent`; nothing when that is 2^63 or more.
std::optional<std::uint64_t> positionOf(std::uint64_t dataStart, std::uint64_t extent, std::uint32_t extentSize,
                                        std::uint32_t offset);

}  // namespace epinspect
