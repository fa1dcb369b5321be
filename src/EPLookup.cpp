#include "EPLookup.h"

#include "etc/ISCSIEPLog.h"

namespace ISCSI::TOOL {

int openForLookup(ISCSIEPFile& file, EPFileStream& stream, const EPLookupIdentity& lookup) {
    const char* path = file.path.c_str();
    if (file.head0Type == 0) {
        const int error = file.parseHead0();
        if (error != 0) {
            EP_LOG_ERR_FOR(lookup.sourceFile, lookup.operation, lookup.parseLine, "Failed to parse header. path: %s",
                           path);
            return error;
        }
    }
    if (file.head0Type != lookup.fileType) {
        errno = 0;
        EP_LOG_ERR_FOR(lookup.sourceFile, lookup.operation, lookup.typeLine, "Wrong EP file type: %d. path: %s",
                       static_cast<int>(file.head0Type), path);
        return EP_ERR_WRONG_FILE_TYPE;
    }
    if (!stream.open(file.path)) {
        EP_LOG_ERR_FOR(lookup.sourceFile, lookup.operation, lookup.openLine, "Failed to open file. path: %s", path);
        return EP_ERR_OPEN_FAILED;
    }
    return 0;
}

int seekToItem(ISCSIEPFile& file, EPFileStream& stream, const EPLookupIdentity& lookup, std::uint64_t offset) {
    const int error = openForLookup(file, stream, lookup);
    if (error != 0) return error;
    return stream.seek(file.head0DataStartOffset + offset) ? 0 : seekFailed(file, lookup);
}

int seekFailed(const ISCSIEPFile& file, const EPLookupIdentity& lookup) {
    EP_LOG_ERR_FOR(lookup.sourceFile, lookup.operation, lookup.seekLine, "Failed to seek to offset. path: %s",
                   file.path.c_str());
    return EP_ERR_SEEK_FAILED;
}

int readFailed(const ISCSIEPFile& file, const EPLookupIdentity& lookup) {
    EP_LOG_ERR_FOR(lookup.sourceFile, lookup.operation, lookup.readLine, "Failed to read file. path: %s",
                   file.path.c_str());
    return EP_ERR_READ_FAILED;
}

}  // namespace ISCSI::TOOL
