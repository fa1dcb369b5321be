// What a store is made of: its folder, its LUN list, and its EP files by kind.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "EPFileBuilder.h"

namespace epsample {

using namespace epbuilder;

/// Bytes of a volume that one data file holds.
inline constexpr std::uint64_t dataFileSpan = std::uint64_t{1} << 42U;

/// A LUN of the LUN list.
struct Lun {
    unsigned int lid;
    std::uint32_t extentSize;
    std::uint64_t size;
    std::uint32_t restoreTime;
    int type;
    std::string typeName;
    std::string uuid;
    std::string rootPath;
    std::string name;
};

/// Makes the folder `root`, with those above it. Throws std::runtime_error where something other than an empty folder
/// is there already, std::system_error where it cannot be made.
void makeRoot(const std::string& root);

/// Writes the LUN list of the store below `root`. Throws std::system_error.
void writeLunList(const std::string& root, const std::vector<Lun>& luns);

/// Where the EP files of volume `number` lie below the store's root, and the name of a data file there.
std::string epFolder(unsigned int number);
std::string dataFileName(std::uint64_t serialNumber);

/// Where the map file of `lun` lies below the store's root.
std::string mapFilePath(const Lun& lun);

/// A table file for extents of `extentSize` bytes in `dataFiles` data files.
EPFileBuilder tableFile(std::uint32_t extentSize, std::uint64_t dataFiles);

/// A data file of `extents` extents, empty but for those in `withText`: they say their number again and again.
EPFileBuilder dataFile(std::uint64_t serialNumber, std::uint32_t extentSize, std::uint64_t extents,
                       const std::vector<std::uint64_t>& withText);

/// The header block of a map file with these counts of entries.
EPFileBuilder mapFile(std::uint64_t total, std::uint64_t mapped, std::uint64_t synced);

}  // namespace epsample
