// Where the extent of a map entry lies on its volume: arithmetic alone, no file is opened.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

#include "Typed.h"
#include "map/EntryBits.h"

namespace inspection {

/// What the number of an extent in its data file counts from: the start of the file, or that of the volume.
enum class CountFrom { file, volume };

/// What the user chose where the format leaves it undecided.
struct PlaceChoice {
    std::optional<AddressBits> addressBits;
    std::optional<CountFrom> countFrom;
};

/// These as they are typed: a size, 48 or 52, "file" or "volume".
Typed<std::uint32_t> extentSizeIn(std::string_view text);
Typed<AddressBits> addressBitsIn(std::string_view text);
Typed<CountFrom> countFromIn(std::string_view text);

/// The extent address of an entry; nothing when it is ambiguous, as ambiguousAddressText() says.
std::optional<std::uint64_t> extentAddressOf(const MapEntry& entry, const PlaceChoice& choice);
std::string ambiguousAddressText(const MapEntry& entry);

/// The data file of an extent, and the extent's number in it by both ways of counting.
struct ExtentPlace {
    std::uint64_t dataFile;  ///< number of the data file
    std::uint64_t inFile;    ///< counted from the first extent that starts in the data file's part of the volume
    std::uint64_t inVolume;  ///< counted from the volume's start: the extent address itself
    std::uint64_t next;      ///< the first extent address of the next data file

    /// The extent's number in the data file by one way of counting.
    std::uint64_t counted(CountFrom from) const { return from == CountFrom::file ? inFile : inVolume; }
};

/// The place of the extent `extentAddress` of `extentSize` bytes; nothing when that is 0 or when the extent would end
/// past byte 2^63 of the volume.
std::optional<ExtentPlace> placeOf(std::uint64_t extentAddress, std::uint32_t extentSize);

/// The address of the first extent that starts in the part of the volume of the data file `number`, or after it.
std::uint64_t firstExtentOf(std::uint64_t number, std::uint32_t extentSize);

/// The position in a data file of byte `offset` of its extent number `extent`; nothing when that is 2^63 or more.
std::optional<std::uint64_t> positionOf(std::uint64_t dataStart, std::uint64_t extent, std::uint32_t extentSize,
                                        std::uint32_t offset);

/// Which way of counting holds for byte `offset` of the extent at `place`, in a data file with `dataSize` bytes after
/// its data start: the chosen one; else the one that lies inside the file, within the file where neither does; nothing
/// where both do and differ.
std::optional<CountFrom> countingOf(const ExtentPlace& place, std::uint32_t extentSize, std::uint64_t offset,
                                    std::uint64_t dataSize, const PlaceChoice& choice);

}  // namespace inspection
