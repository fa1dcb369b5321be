#include "SampleStore.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <fstream>
#include <system_error>
#include <utility>
#include <vector>

#include "StoreFiles.h"

namespace epsample {

namespace {

constexpr std::uint32_t extentSize1 = 1048576;
constexpr std::uint32_t extentSize2 = 65536;
constexpr std::uint64_t entries2 = 256;
constexpr std::uint64_t extentsPerDataFile = dataFileSpan / extentSize1;

/// LUN 3 has as many as LUN 1 once had.
std::uint64_t entriesOfLun3(std::uint64_t entriesOfLun1) { return std::min<std::uint64_t>(entriesOfLun1, 1024); }

/// The entries of LUN 1 repeat after as many, but for extent addresses, which go on.
constexpr std::uint64_t cycle = 4096;

/// The entry `index` of LUN 1: runs, holes and fragments. An extent address is the index itself, within a stretch of
/// fragments the stretch counted from its end; those of pool 16 lie a data file further on. So none occurs twice.
MapEntry entryOfLun1(std::uint64_t index) {
    const std::uint64_t place = index % 1024;
    const bool fragment = place >= 896;
    MapEntry entry;
    if (index / 1024 % 4 == 2 || (place >= 400 && place < 512) || (place >= 800 && place < 896) ||
        (fragment && place % 2 == 1)) {
        return entry;
    }
    entry.mapped = true;
    entry.extentAddress = index;
    if (place < 400) {
        entry.synced = true;
    } else if (place < 768) {
        entry.poolNumber = 16;
        entry.extentAddress = extentsPerDataFile + index;
    } else if (place < 800) {
        entry.vpushed = true;
        entry.vpulled = place >= 784;
    } else {
        entry.extentAddress = index - place + (896 + 1023 - place);
    }
    return entry;
}

EPFileBuilder mapHeaderOfLun1(std::uint64_t entries) {
    std::uint64_t mapped = 0;
    std::uint64_t synced = 0;
    for (std::uint64_t index = 0; index < cycle; ++index) {
        const std::uint64_t times = entries / cycle + (index < entries % cycle ? 1 : 0);
        const MapEntry entry = entryOfLun1(index);
        mapped += entry.mapped ? times : 0;
        synced += entry.synced ? times : 0;
    }
    return mapFile(entries, mapped, synced);
}

/// Writes the entries of LUN 1 after the header block, one cycle at a time.
void writeEntriesOfLun1(const std::string& path, std::uint64_t entries) {
    std::array<std::uint64_t, cycle> stored{};
    std::array<std::uint64_t, cycle> step{};
    for (std::size_t i = 0; i < cycle; ++i) {
        const MapEntry entry = entryOfLun1(i);
        stored[i] = entry.stored();
        step[i] = entry.mapped ? cycle : 0;
    }
    std::ofstream file(path, std::ios::binary | std::ios::in | std::ios::out);
    file.seekp(static_cast<std::streamoff>(headerBlockSize));
    std::array<char, 8 * cycle> block{};
    for (std::uint64_t first = 0; first < entries && file; first += cycle) {
        char* byte = block.data();
        for (std::size_t i = 0; i < cycle; ++i) {
            for (unsigned int shift = 0; shift < 64; shift += 8) *byte++ = static_cast<char>(stored[i] >> shift);
            stored[i] += step[i];
        }
        file.write(block.data(), static_cast<std::streamsize>(8 * std::min(entries - first, cycle)));
    }
    file.close();
    if (!file) throw std::system_error(errno, std::generic_category(), path);
}

/// Of LUN 3, as a snapshot of LUN 1 would be: entries 640 to 799 are those of LUN 1, 416 to 431 are its own, at extents
/// that LUN 1 never has.
void writeMapOfLun3(const std::string& path, std::uint64_t entries) {
    std::vector<std::pair<std::uint64_t, MapEntry>> stored;
    for (std::uint64_t i = 416; i < 432 && i < entries; ++i)
        stored.emplace_back(i, MapEntry{i, 0, true, false, false, false});
    for (std::uint64_t i = 640; i < 800 && i < entries; ++i) stored.emplace_back(i, entryOfLun1(i));
    EPFileBuilder map = mapFile(entries, stored.size(), 0);
    map.set(head0::uuid, 0x42).set(epbuilder::map::parentUUID, 0x40);  // the UUID of LUN 1's map file
    for (const auto& [index, entry] : stored) map.entry(index, entry.stored());
    map.write(path);
}

/// Writes volume 1, for LUN 1 and its snapshot.
void writeVolume1(const std::string& root, const std::vector<Lun>& luns, std::uint64_t entries) {
    const std::string folder = root + epFolder(1);
    const std::uint64_t dataFiles = 2 + (entries > 0 ? (entries - 1) / extentsPerDataFile : 0);
    tableFile(extentSize1, dataFiles).write(folder + "EP_TBL");
    EPFileBuilder::freeIndex().write(folder + "EP_FRI");
    for (std::uint64_t number = 0; number < dataFiles; ++number) {
        const std::uint64_t used = number == 0 ? entries : entries - (number - 1) * extentsPerDataFile;
        const std::uint64_t extents = std::clamp<std::uint64_t>(used, 6144, extentsPerDataFile);
        dataFile(number, extentSize1, extents, {0, 1, 514, 2047, 2048, 4095, 4096, 5200})
            .write(folder + dataFileName(number));
    }
    const std::string mapPath = root + mapFilePath(luns[0]);
    mapHeaderOfLun1(entries).write(mapPath);
    writeEntriesOfLun1(mapPath, entries);
    writeMapOfLun3(root + mapFilePath(luns[2]), entriesOfLun3(entries));
}

/// Writes volume 2, all for LUN 2: some runs, one of them backwards.
void writeVolume2(const std::string& root, const Lun& lun) {
    const std::string folder = root + epFolder(2);
    tableFile(extentSize2, 1).write(folder + "EP_TBL");
    EPFileBuilder::freeIndex().write(folder + "EP_FRI");
    dataFile(0, extentSize2, 256, {16, 80, 128, 175}).write(folder + dataFileName(0));
    EPFileBuilder map = mapFile(entries2, 64 + 16 + 48, 64 + 48);
    map.set(head0::uuid, 0x41);
    for (std::uint64_t i = 0; i < 64; ++i) map.entry(i, MapEntry{16 + i, 32, true, false, false, true}.stored());
    for (std::uint64_t i = 0; i < 16; ++i) map.entry(128 + i, MapEntry{95 - i, 32, true, false, true, false}.stored());
    for (std::uint64_t i = 0; i < 48; ++i) map.entry(144 + i, MapEntry{128 + i, 0, true, true, false, true}.stored());
    map.write(root + mapFilePath(lun));
}

}  // namespace

void writeSampleStore(const std::string& root, std::uint64_t mapEntries) {
    const std::vector<Lun> luns = {
        {1, extentSize1, mapEntries * extentSize1, 1600000120, 263, "BLUN", "6f1c1d0a-58d3-4e0f-9b51-2f7a9c5e0d11",
         "/volume1", "lun1"},
        {2, extentSize2, entries2 * extentSize2, 0, 7, "THIN", "0b9d2f64-7c1e-4a55-8a3b-90c4d7e6f522", "/volume2",
         "lun2"},
        {3, extentSize1, entriesOfLun3(mapEntries) * extentSize1, 1600000240, 263, "BLUN",
         "91e80b7c-2d46-4f3a-a6c5-18d07f2b6e33", "/volume1", "lun1-snapshot"},
    };
    EPFileBuilder::journal().write(root + "/var/db/iscsi/EP_JNL");
    writeLunList(root, luns);
    writeVolume1(root, luns, mapEntries);
    writeVolume2(root, luns[1]);
}

}  // namespace epsample
