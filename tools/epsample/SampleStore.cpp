#include "SampleStore.h"

#include <cerrno>
#include <fstream>
#include <system_error>

namespace epsample {

namespace {

constexpr const char* lunUUID = "6f1c1d0a-58d3-4e0f-9b51-2f7a9c5e0d11";

constexpr std::uint64_t extentsPerDataFile = std::uint64_t{1} << 22U;  // 4 TiB in extents of 1 MiB

[[noreturn]] void failed(const std::string& path) { throw std::system_error(errno, std::generic_category(), path); }

void appendMapEntries(const std::string& path, std::uint64_t count) {
    std::ofstream file(path, std::ios::binary | std::ios::app);
    std::string block;
    for (std::uint64_t index = 0; index < count; ++index) {
        block += littleEndian(sampleEntry(index).stored(), 8);
        if (block.size() == 65536 || index + 1 == count) {
            file << block;
            block.clear();
        }
    }
    file.close();
    if (!file) failed(path);
}

void writeMapFile(const std::string& path, std::uint64_t count) {
    std::uint64_t mapped = 0;
    std::uint64_t synced = 0;
    for (std::uint64_t index = 0; index < count; ++index) {
        const MapEntry entry = sampleEntry(index);
        mapped += entry.mapped ? 1 : 0;
        synced += entry.synced ? 1 : 0;
    }
    EPFileBuilder::map()
        .set(map::totalCount, count)
        .set(map::mappedCount, mapped)
        .set(map::syncCount, synced)
        .write(path);
    appendMapEntries(path, count);
}

/// A data file of 6 GiB of extents, a few of them with their own number as content, again and again.
void writeDataFile(const std::string& path, unsigned int serialNumber) {
    EPFileBuilder file = EPFileBuilder::data();
    file.set(dat::serialNumber, serialNumber);
    for (const std::uint64_t extent : {0U, 1U, 2047U, 2048U, 4095U, 4096U, 5200U}) {
        std::string text = "file " + std::to_string(serialNumber) + " extent " + std::to_string(extent) + "\n";
        text.resize(32, '.');
        std::string content;
        while (content.size() < 4096) content += text;
        file.bytes(headerBlockSize + extent * extentSize, content);
    }
    file.resize(headerBlockSize + std::uint64_t{6144} * extentSize).write(path);
}

void writeLunList(const std::string& path) {
    std::ofstream file(path, std::ios::trunc);
    file << R"([
  {"lid": 1, "extentSize": 1048576, "size": 10737418240, "restoreTime": 1600000120, "type": 263,
   "uuid": ")"
         << lunUUID << R"(", "rootPath": "/volume1", "name": "lun1"},
  {"lid": 2, "extentSize": 0, "size": 1073741824, "restoreTime": 0, "type": 3,
   "uuid": "0b9d2f64-7c1e-4a55-8a3b-90c4d7e6f522", "rootPath": "/volume1", "name": "lun2"}
]
)";
    file.close();
    if (!file) failed(path);
}

}  // namespace

MapEntry sampleEntry(std::uint64_t index) {
    const std::uint64_t period = index / 1024;
    const std::uint64_t place = index % 1024;
    MapEntry entry;
    const bool fragment = place >= 896;
    if (period % 4 == 2 || (place >= 400 && place < 512) || (place >= 800 && place < 896) ||
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
        entry.extentAddress = 2 * index;
    }
    return entry;
}

void writeSampleStore(const std::string& root, std::uint64_t mapEntries) {
    const std::string volume = root + "/volume1/@iSCSI/";
    EPFileBuilder::journal().write(root + "/var/db/iscsi/EP_JNL");
    writeLunList(root + "/var/db/iscsi/luns.json");
    EPFileBuilder::table().set(tbl::extentSize, extentSize).write(volume + "EP/EP_TBL");
    EPFileBuilder::freeIndex().write(volume + "EP/EP_FRI");
    writeDataFile(volume + "EP/EP_DAT_00000", 0);
    writeDataFile(volume + "EP/EP_DAT_00001", 1);
    writeMapFile(volume + "LUN/BLUN" + lunUUID + "lun1_00000", mapEntries);
}

}  // namespace epsample
