#include "DiskStore.h"

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <fstream>
#include <system_error>
#include <vector>

#include "StoreFiles.h"

namespace epsample {

namespace {

constexpr std::uint32_t extentSize = 65536;
constexpr std::uint64_t fileCount = 3;
constexpr std::uint64_t runLength = 8;  ///< of extents that lie together

[[noreturn]] void fail(const std::string& path) { throw std::system_error(errno, std::generic_category(), path); }

/// Where the extents of the disk lie: runs in turn in each of the data files, and in each from its end to its start.
struct Layout {
    explicit Layout(std::uint64_t extents)
        : runsInFile((extents + fileCount * runLength - 1) / (fileCount * runLength)) {}

    std::uint64_t fileOf(std::uint64_t index) const { return index / runLength % fileCount; }
    std::uint64_t extentInFile(std::uint64_t index) const {
        return (runsInFile - 1 - index / runLength / fileCount) * runLength + index % runLength;
    }

    std::uint64_t runsInFile;
};

std::vector<std::fstream> makeDataFiles(const std::string& folder, const Layout& layout) {
    std::vector<std::fstream> files;
    for (std::uint64_t number = 0; number < fileCount; ++number) {
        const std::string path = folder + dataFileName(number);
        dataFile(number, extentSize, layout.runsInFile * runLength, {}).write(path);
        files.emplace_back(path, std::ios::binary | std::ios::in | std::ios::out);
        if (!files.back()) fail(path);
    }
    return files;
}

void writeExtent(std::fstream& file, std::uint64_t extent, const std::string& bytes) {
    file.seekp(static_cast<std::streamoff>(headerBlockSize + extent * extentSize));
    file.write(bytes.data(), static_cast<std::streamsize>(bytes.size()));
}

}  // namespace

void writeDiskStore(const std::string& root, const std::string& image) {
    std::ifstream disk(image, std::ios::binary);
    if (!disk) fail(image);
    const std::uint64_t extents = (std::filesystem::file_size(image) + extentSize - 1) / extentSize;
    const Lun lun = {1,          extentSize, extents * extentSize, 0, 7, "THIN", "9d4e7b52-1c36-4f8a-a0e5-d2b8639f7c41",
                     "/volume1", "disk"};
    const std::string folder = root + epFolder(1);
    const Layout layout(extents);
    EPFileBuilder::journal().write(root + "/var/db/iscsi/EP_JNL");
    writeLunList(root, {lun});
    tableFile(extentSize, fileCount).write(folder + "EP_TBL");
    EPFileBuilder::freeIndex().write(folder + "EP_FRI");
    auto files = makeDataFiles(folder, layout);
    std::string entries;
    std::uint64_t mapped = 0;
    for (std::uint64_t index = 0; index < extents; ++index) {
        std::string bytes(extentSize, '\0');
        disk.read(bytes.data(), extentSize);
        if (disk.bad()) fail(image);
        const bool zeros = std::all_of(bytes.begin(), bytes.end(), [](char byte) { return byte == '\0'; });
        MapEntry entry;
        if (!zeros || index % 32 == 5) {
            const std::uint64_t file = layout.fileOf(index);
            entry.mapped = entry.synced = true;
            entry.extentAddress = file * (dataFileSpan / extentSize) + layout.extentInFile(index);
            if (!zeros) writeExtent(files[static_cast<std::size_t>(file)], layout.extentInFile(index), bytes);
            ++mapped;
        }
        entries += littleEndian(entry.stored(), 8);
    }
    for (std::size_t number = 0; number < fileCount; ++number) {
        files[number].close();
        if (!files[number]) fail(folder + dataFileName(number));
    }
    mapFile(extents, mapped, mapped).bytes(headerBlockSize, entries).write(root + mapFilePath(lun));
}

}  // namespace epsample
