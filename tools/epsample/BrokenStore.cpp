// Where each fault lies. LUNs 1 to 12 have their maps on volume 2, whose EP files are sound.
//
//   version            /var/db/iscsi/EP_JNL
//   magic              /volume1/@iSCSI/EP/EP_TBL
//   kind               /volume1/@iSCSI/EP/EP_FRI: the type of a data file
//   data-start         /volume1/@iSCSI/EP/EP_DAT_00000: inside the header block
//   serial-number      /volume1/@iSCSI/EP/EP_DAT_00001
//   total-count to lun-size   the map files of LUNs 1 to 11
//   missing-map        LUN 12 of the LUN list
//   extent-size        /volume3/@iSCSI/EP/EP_TBL, against LUN 13
//   same-map           LUNs 14 and 15 of the LUN list, which differ in nothing but their ids
//   missing-file       /volume4/@iSCSI/EP/EP_FRI, which these two need
#include "BrokenStore.h"

#include <cstdint>
#include <vector>

#include "StoreFiles.h"

namespace epsample {

namespace {

constexpr std::uint32_t extentSize = 65536;
constexpr std::uint64_t extentsPerDataFile = dataFileSpan / extentSize;
constexpr std::uint64_t dataFileExtents = 1024;
constexpr std::uint64_t entries = 16;

Lun soundLun(unsigned int lid, const std::string& volume, const std::string& name) {
    const std::string uuid =
        "00000000-0000-4000-8000-0000000000" + std::string(lid < 10 ? "0" : "") + std::to_string(lid);
    return {lid, extentSize, entries * extentSize, 0, 7, "THIN", uuid, volume, name};
}

/// The entry `index` of the LUN `lid`: the first twelve are mapped, to extents that no other LUN uses.
MapEntry soundEntry(unsigned int lid, std::uint64_t index) {
    return {entries * lid + index, 16, true, false, false, index < 8};
}

EPFileBuilder soundMap(unsigned int lid) {
    EPFileBuilder file = mapFile(entries, 12, 8);
    for (std::uint64_t index = 0; index < 12; ++index) file.entry(index, soundEntry(lid, index).stored());
    return file;
}

EPFileBuilder soundData(std::uint64_t serialNumber) { return dataFile(serialNumber, extentSize, dataFileExtents, {}); }

/// What goes wrong in the map file of the LUN `lid`.
struct MapFault {
    const char* rule;
    void (*commit)(EPFileBuilder& file, unsigned int lid);
};

/// Replaces entry 3, a mapped one, by one with another extent address.
void moveEntry3(EPFileBuilder& file, unsigned int lid, std::uint64_t extentAddress) {
    MapEntry entry = soundEntry(lid, 3);
    entry.extentAddress = extentAddress;
    file.entry(3, entry.stored());
}

constexpr MapFault mapFaults[] = {
    {"total-count", [](EPFileBuilder& file, unsigned int) { file.resize(headerBlockSize + 8 * (entries - 1)); }},
    {"mapped-count", [](EPFileBuilder& file, unsigned int) { file.set(map::mappedCount, 13); }},
    {"sync-count", [](EPFileBuilder& file, unsigned int) { file.set(map::syncCount, 7); }},
    {"pool-count", [](EPFileBuilder& file, unsigned int) { file.set(map::seg0PoolCount, 1025); }},
    {"partial-entry", [](EPFileBuilder& file, unsigned int) { file.resize(headerBlockSize + 8 * entries + 4); }},
    {"unmapped-bits", [](EPFileBuilder& file, unsigned int lid) { file.entry(12, entries * lid + 12); }},
    {"address-bits", [](EPFileBuilder& file,
                        unsigned int lid) { file.entry(3, soundEntry(lid, 3).stored() | std::uint64_t{1} << 48U); }},
    {"missing-data-file",
     [](EPFileBuilder& file, unsigned int lid) { moveEntry3(file, lid, extentsPerDataFile + entries * lid + 3); }},
    {"beyond-data-file", [](EPFileBuilder& file, unsigned int lid) { moveEntry3(file, lid, dataFileExtents); }},
    {"shared-extents", [](EPFileBuilder& file, unsigned int lid) { moveEntry3(file, lid, entries * lid + 2); }},
};

/// Volume 1, which no LUN uses: a fault in each file.
void writeVolume1(const std::string& root) {
    const std::string folder = root + epFolder(1);
    tableFile(extentSize, 2).set(head0::magicCode, 0).write(folder + "EP_TBL");
    EPFileBuilder::freeIndex().set(head0::type, 3).write(folder + "EP_FRI");
    soundData(0).set(head0::dataStartOffset, headerBlockSize - 8192).write(folder + dataFileName(0));
    soundData(7).write(folder + dataFileName(1));
}

void writeFreeIndex(const std::string& root, unsigned int volume) {
    EPFileBuilder::freeIndex().write(root + epFolder(volume) + "EP_FRI");
}

/// The files of a volume but for the free-index file: a data file, and a table for extents of `tableExtentSize` bytes.
void writeVolume(const std::string& root, unsigned int number, std::uint32_t tableExtentSize) {
    const std::string folder = root + epFolder(number);
    tableFile(tableExtentSize, 1).write(folder + "EP_TBL");
    soundData(0).write(folder + dataFileName(0));
}

}  // namespace

void writeBrokenStore(const std::string& root) {
    EPFileBuilder::journal().set(head0::version, 1).write(root + "/var/db/iscsi/EP_JNL");
    writeVolume1(root);
    writeVolume(root, 2, extentSize);
    writeVolume(root, 3, 2 * extentSize);
    writeVolume(root, 4, extentSize);
    writeFreeIndex(root, 2);
    writeFreeIndex(root, 3);
    std::vector<Lun> luns;
    const auto addLun = [&](const std::string& volume, const char* name) -> Lun& {
        return luns.emplace_back(soundLun(static_cast<unsigned int>(luns.size() + 1), volume, name));
    };
    for (const MapFault& fault : mapFaults) {
        const Lun& lun = addLun("/volume2", fault.rule);
        EPFileBuilder file = soundMap(lun.lid);
        fault.commit(file, lun.lid);
        file.write(root + mapFilePath(lun));
    }
    Lun& wrongSize = addLun("/volume2", "lun-size");
    wrongSize.size += extentSize;
    soundMap(wrongSize.lid).write(root + mapFilePath(wrongSize));
    addLun("/volume2", "missing-map");
    const Lun& otherExtents = addLun("/volume3", "extent-size");
    soundMap(otherExtents.lid).write(root + mapFilePath(otherExtents));
    Lun twin = addLun("/volume4", "same-map");
    soundMap(twin.lid).write(root + mapFilePath(twin));
    ++twin.lid;
    luns.push_back(twin);
    writeLunList(root, luns);
}

}  // namespace epsample
