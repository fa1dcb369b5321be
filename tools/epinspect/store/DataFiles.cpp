#include "store/DataFiles.h"

#include <cerrno>

#include "store/Doubts.h"
#include "store/FileSize.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

const DataFile& DataFiles::at(const ExtentPlace& place) {
    constexpr std::size_t mostFiles = 64;  // 256 TiB; what a file takes is mainly its header block
    const auto known = files_.find(place.dataFile);
    if (known != files_.end()) return known->second;
    if (files_.size() >= mostFiles) files_.clear();
    return files_.emplace(place.dataFile, open(place)).first->second;
}

DataFile DataFiles::open(const ExtentPlace& place) {
    DataFile data;
    data.error = tool::ISCSIEPFile(mapPath_).getDATFilePath(extentSize_, place.inVolume, data.path);
    if (data.error != 0) return data;
    data.error = tool::EP_ERR_OPEN_FAILED;
    const auto hostPath = session_.openablePath(data.path);
    if (!hostPath) return data;
    auto file = std::make_unique<tool::ISCSIEPFileDAT>(*hostPath);
    // Nothing is read yet: this tells whether there can be extents at all.
    const int error = file->getExtentBytes(0, extentSize_, 0, 0, nullptr);
    data.reason = errno;
    if (error != 0) {
        data.error = error;
        return data;
    }
    sayDataStartDoubts(*file, data.path);
    const auto size = sizeOf(*hostPath);
    data.reason = errno;
    if (!size) return data;
    if (*size > file->head0DataStartOffset) data.dataSize = *size - file->head0DataStartOffset;
    data.error = data.reason = 0;
    data.file = std::move(file);
    return data;
}

}  // namespace epinspect
