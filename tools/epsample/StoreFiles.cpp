#include "StoreFiles.h"

#include <cerrno>
#include <filesystem>
#include <fstream>
#include <stdexcept>
#include <system_error>

namespace epsample {

void makeRoot(const std::string& root) {
    namespace fs = std::filesystem;
    if (!fs::exists(root)) {
        fs::create_directories(root);
    } else if (!fs::is_directory(root)) {
        throw std::runtime_error(root + ": not a folder");
    } else if (!fs::is_empty(root)) {
        throw std::runtime_error(root + ": not empty, and nothing is overwritten; name a new folder or an empty one");
    }
}

void writeLunList(const std::string& root, const std::vector<Lun>& luns) {
    const std::string path = root + "/var/db/iscsi/luns.json";
    std::filesystem::create_directories(root + "/var/db/iscsi");
    std::ofstream file(path, std::ios::trunc);
    const char* separator = "[\n";
    for (const Lun& lun : luns) {
        file << separator << R"(  {"lid": )" << lun.lid << R"(, "extentSize": )" << lun.extentSize << R"(, "size": )"
             << lun.size << R"(, "restoreTime": )" << lun.restoreTime << R"(, "type": )" << lun.type
             << ",\n   \"uuid\": \"" << lun.uuid << R"(", "rootPath": ")" << lun.rootPath << R"(", "name": ")"
             << lun.name << "\"}";
        separator = ",\n";
    }
    file << "\n]\n";
    file.close();
    if (!file) throw std::system_error(errno, std::generic_category(), path);
}

std::string epFolder(unsigned int number) { return "/volume" + std::to_string(number) + "/@iSCSI/EP/"; }

std::string dataFileName(std::uint64_t serialNumber) {
    const std::string number = std::to_string(serialNumber);
    return "EP_DAT_" + std::string(number.size() < 5 ? 5 - number.size() : 0, '0') + number;
}

std::string mapFilePath(const Lun& lun) {
    return lun.rootPath + "/@iSCSI/LUN/" + lun.typeName + lun.uuid + lun.name + "_00000";
}

EPFileBuilder tableFile(std::uint32_t extentSize, std::uint64_t dataFiles) {
    EPFileBuilder file = EPFileBuilder::table();
    return file.set(tbl::extentSize, extentSize).set(tbl::totalCount, dataFiles * (dataFileSpan / extentSize));
}

EPFileBuilder dataFile(std::uint64_t serialNumber, std::uint32_t extentSize, std::uint64_t extents,
                       const std::vector<std::uint64_t>& withText) {
    EPFileBuilder file = EPFileBuilder::data();
    file.set(dat::serialNumber, serialNumber);
    for (const std::uint64_t extent : withText) {
        std::string line = "file " + std::to_string(serialNumber) + " extent " + std::to_string(extent) + "\n";
        line.resize(32, '.');
        std::string content;
        while (content.size() < extentSize) content += line;
        file.bytes(headerBlockSize + extent * extentSize, content);
    }
    return file.resize(headerBlockSize + extents * extentSize);
}

EPFileBuilder mapFile(std::uint64_t total, std::uint64_t mapped, std::uint64_t synced) {
    EPFileBuilder file = EPFileBuilder::map();
    file.set(map::totalCount, total).set(map::mappedCount, mapped).set(map::syncCount, synced);
    return file.set(map::seg0PoolCount, 2).resize(headerBlockSize + total * 8);
}

}  // namespace epsample
