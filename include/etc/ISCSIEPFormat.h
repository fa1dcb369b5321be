// What the format of EP files fixes, beside the header block: the bits of a map entry, how much a data file and a map's
// pool list hold, and where the files lie. Whoever needs one of these facts takes it from here.
#pragma once

namespace ISCSI::TOOL {

/// Bytes of a stored map entry, a little-endian number of 64 bits. Its flags:
inline constexpr unsigned int EP_MAP_ENTRY_SIZE = 8;
inline constexpr unsigned long long EP_MAP_ENTRY_MAPPED = 1ULL << 63;
inline constexpr unsigned long long EP_MAP_ENTRY_VPUSHED = 1ULL << 62;
inline constexpr unsigned long long EP_MAP_ENTRY_VPULLED = 1ULL << 61;
inline constexpr unsigned long long EP_MAP_ENTRY_SYNCED = 1ULL << 60;

/// Its other bits: extent address and pool number. Bits 48 to 51 count in both, until the program that writes map files
/// settles to which they belong. Taking them out of one of these two masks settles it, everything else follows.
inline constexpr unsigned long long EP_MAP_ENTRY_ADDRESS_MASK = 0x000FFFFFFFFFFFFF;
inline constexpr unsigned long long EP_MAP_ENTRY_POOL_MASK = 0x0FFF000000000000;

/// The bits that count in both fields, 0 once that is settled; and the place of the pool number's lowest bit.
inline constexpr unsigned long long EP_MAP_ENTRY_AMBIGUOUS_MASK = EP_MAP_ENTRY_ADDRESS_MASK & EP_MAP_ENTRY_POOL_MASK;
inline constexpr unsigned int EP_MAP_ENTRY_POOL_SHIFT = __builtin_ctzll(EP_MAP_ENTRY_POOL_MASK);

static_assert((EP_MAP_ENTRY_ADDRESS_MASK | EP_MAP_ENTRY_POOL_MASK) == EP_MAP_ENTRY_SYNCED - 1,
              "every bit below the flags belongs to a field");

/// How many pool UUIDs a map file holds at most.
inline constexpr unsigned int EP_POOL_COUNT_MAX = 1024;

/// How many bytes of its volume a data file stands for: data file N for those from N * EP_DAT_FILE_SPAN on.
inline constexpr unsigned long long EP_DAT_FILE_SPAN = 1ULL << 42;

/// The names of the files. A data file's name ends in its number, in decimal and with at least five digits.
inline constexpr char EP_JNL_FILE_NAME[] = "EP_JNL";
inline constexpr char EP_TBL_FILE_NAME[] = "EP_TBL";
inline constexpr char EP_FRI_FILE_NAME[] = "EP_FRI";
inline constexpr char EP_DAT_FILE_PREFIX[] = "EP_DAT_";
inline constexpr unsigned int EP_DAT_NUMBER_DIGITS = 5;

/// The name of a LUN's map file is the LUN's type name, UUID and name, and ends in this.
inline constexpr char EP_MAP_NAME_END[] = "_00000";

/// Their folders, each with the slashes around it.
inline constexpr char EP_JNL_FOLDER[] = "/var/db/iscsi/";  ///< the machine's journal
inline constexpr char EP_VOLUME_PREFIX[] = "/volume";      ///< a volume, its number follows
inline constexpr char EP_VOLUME_FOLDER[] = "/@iSCSI/EP/";  ///< on a volume: table, free-index and data files
inline constexpr char EP_MAP_FOLDER[] = "/@iSCSI/LUN/";    ///< below a LUN's root path: its map file
inline constexpr char EP_ISCSI_FOLDER[] = "/@iSCSI/";      ///< the folder above the last two

}  // namespace ISCSI::TOOL
