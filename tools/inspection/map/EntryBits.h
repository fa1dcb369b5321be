// The bits of a map entry, and which of them are ambiguous: all that follows from the masks of the format.
#pragma once

#include <ISCSIEPFileMAP.h>
#include <etc/ISCSIEPFormat.h>

#include <cstdint>
#include <limits>

namespace inspection {

using MapEntry = ISCSI::TOOL::ISCSIEPMapEntryInfo;

/// Bytes of an entry.
inline constexpr std::uint64_t entrySize = ISCSI::TOOL::EP_MAP_ENTRY_SIZE;

/// The four flags as one number.
inline unsigned int flagsOf(const MapEntry& entry) {
    return (entry.mapped ? 1U : 0U) | (entry.vpushed ? 2U : 0U) | (entry.vpulled ? 4U : 0U) | (entry.synced ? 8U : 0U);
}

/// Whether all bits of the entry are zero.
inline bool isHole(const MapEntry& entry) {
    return entry.extentAddress == 0 && entry.poolNumber == 0 && flagsOf(entry) == 0;
}

/// The bits below the flags as they are stored: extent address and pool number, wherever they are divided.
inline std::uint64_t lowBitsOf(const MapEntry& entry) {
    return std::uint64_t{entry.poolNumber} << ISCSI::TOOL::EP_MAP_ENTRY_POOL_SHIFT | entry.extentAddress;
}

/// A mapped entry whose bits below the flags are these.
inline MapEntry mappedEntry(std::uint64_t lowBits) {
    using namespace ISCSI::TOOL;
    const auto pool = static_cast<unsigned int>((lowBits & EP_MAP_ENTRY_POOL_MASK) >> EP_MAP_ENTRY_POOL_SHIFT);
    return {lowBits & EP_MAP_ENTRY_ADDRESS_MASK, pool, true, false, false, false};
}

/// All that is stored in an entry.
inline std::uint64_t bitsOf(const MapEntry& entry) {
    using namespace ISCSI::TOOL;
    return (entry.mapped ? EP_MAP_ENTRY_MAPPED : 0) | (entry.vpushed ? EP_MAP_ENTRY_VPUSHED : 0) |
           (entry.vpulled ? EP_MAP_ENTRY_VPULLED : 0) | (entry.synced ? EP_MAP_ENTRY_SYNCED : 0) | lowBitsOf(entry);
}

/// The ambiguous bits, which count in both numbers, shifted down to bit 0; and whether one of them is set. Once the
/// masks of the format no longer overlap, none ever is.
inline std::uint64_t ambiguousBitsOf(const MapEntry& entry) {
    return (entry.extentAddress & ISCSI::TOOL::EP_MAP_ENTRY_AMBIGUOUS_MASK) >> ISCSI::TOOL::EP_MAP_ENTRY_POOL_SHIFT;
}
inline bool isAmbiguous(const MapEntry& entry) { return ambiguousBitsOf(entry) != 0; }

/// The two readings of an ambiguous entry, by how many low bits are its extent address.
enum class AddressBits : unsigned int { bits48 = 48, bits52 = 52 };

/// An entry's extent address and pool number, read in one of the two ways.
struct ExtentAddress {
    std::uint64_t extent;
    unsigned int pool;
};

inline ExtentAddress readAs(const MapEntry& entry, AddressBits bits) {
    constexpr std::uint64_t mask = ISCSI::TOOL::EP_MAP_ENTRY_AMBIGUOUS_MASK;
    if (bits == AddressBits::bits48) return {entry.extentAddress & ~mask, entry.poolNumber};
    return {entry.extentAddress, entry.poolNumber >> __builtin_popcountll(mask)};
}

/// Where an entry lies in the file, counted from its start.
inline std::uint64_t entryOffset(const ISCSI::TOOL::ISCSIEPFileMAP& file, std::uint64_t index) {
    return file.head0DataStartOffset + entrySize * index;
}

/// Whether entry `index` of `file`, whose HEAD[0] is decoded, lies where a file can have bytes: below 2^63.
inline bool isReachable(const ISCSI::TOOL::ISCSIEPFileMAP& file, std::uint64_t index) {
    constexpr auto limit = static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max());
    return file.head0DataStartOffset <= limit && index < (limit - file.head0DataStartOffset) / entrySize;
}

}  // namespace inspection
