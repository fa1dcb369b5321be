#include "EPLookup.h"

#include "EPLog.h"

namespace ISCSI::TOOL {

int seekToItem(ISCSIEPFile& file, EPFileStream& stream, const EPLookup& lookup, std::uint64_t index,
               std::uint32_t itemSize) {
    const char* path = file.path.c_str();
    if (file.head0Type == 0) {
        const int error = file.parseHead0();
        if (error != 0) {
            EP_LOG_ERR_FOR(lookup.sourceFile, lookup.operation, lookup.headerLine, "Failed to parse header. path: %s",
                           path);
            return error;
        }
    }
    if (file.head0Type != lookup.fileType) {
        EP_LOG_ERR_FOR(lookup.sourceFile, lookup.operation, lookup.typeLine, "Wrong EP file type: %d. path: %s",
                       static_cast<int>(file.head0Type), path);
        return EP_ERR_WRONG_FILE_TYPE;
    }
    if (!stream.isOpen()) {
        EP_LOG_ERR_FOR(lookup.sourceFile, lookup.operation, lookup.openLine, "Failed to open file. path: %s", path);
        return EP_ERR_OPEN_FAILED;
    }
    if (!stream.seek(file.head0DataStartOffset + index * itemSize)) {
        EP_LOG_ERR_FOR(lookup.sourceFile, lookup.operation, lookup.seekLine, "Failed to seek to offset. path: %s",
                       path);
        return EP_ERR_SEEK_FAILED;
    }
    return 0;
}

int readFailed(const ISCSIEPFile& file, const EPLookup& lookup) {
    EP_LOG_ERR_FOR(lookup.sourceFile, lookup.operation, lookup.readLine, "Failed to read file. path: %s",
                   file.path.c_str());
    return EP_ERR_READ_FAILED;
}

}  // namespace ISCSI::TOOL
