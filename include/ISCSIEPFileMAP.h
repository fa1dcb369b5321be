// The map file of one LUN, and the entries it holds.
#pragma once

#include <string>
#include <vector>

#include "ISCSIEPFile.h"
#include "ISCSIEPMapEntryInfo.h"
#include "etc/ISCSIEPFormat.h"

namespace ISCSI::TOOL {

/// A LUN's map file: sections that describe the map, and from the data start offset one 8-byte entry per index.
class ISCSI_EP_EXPORT ISCSIEPFileMAP : public ISCSIEPFile {
public:
    ISCSIEPFileMAP();
    explicit ISCSIEPFileMAP(const std::string& filePath);
    ~ISCSIEPFileMAP() override;

    /// Decodes HEAD[0], HEAD[1], VAR[0] to VAR[2] and SEG[0], whatever type HEAD[0] names; reads the file at most once.
    /// At most EP_POOL_COUNT_MAX pool UUIDs are read, whatever `seg0PoolCount` says. A repeated call appends them
    /// again. Returns 0, a code of parseHead0() (the members below then stay as they were), or EP_ERR_BAD_UUID: the
    /// members before the failing UUID are then new, later ones as they were, and pool UUIDs already appended stay.
    int parseFile();

    /// Reads the entry of `index` into `entry`: 8 bytes at head0DataStartOffset + 8 * `index`, modulo 2^64. Needs no
    /// earlier parseFile() and compares the index with nothing but the length of the file.
    /// Returns 0, or in the order of the checks: a parseHead0() code, EP_ERR_WRONG_FILE_TYPE, EP_ERR_OPEN_FAILED,
    /// EP_ERR_SEEK_FAILED, EP_ERR_READ_FAILED. `entry` then keeps its content.
    int getMapEntry(unsigned long long index, ISCSIEPMapEntryInfo& entry);

    /// Replaces `entries` by the run of `count` entries that starts at index `first`, or by fewer where the file ends
    /// earlier: by none at or past its end. Reads with one open, one seek and large reads; allocates by what the file
    /// holds, not by `count`, which may be anything. A `count` of 0 gives an empty list and touches no file.
    /// Returns 0, or in the order of the checks as getMapEntry(), EP_ERR_READ_FAILED only when a read fails or memory
    /// cannot hold the run. `entries` then keeps its content.
    int getMapEntries(unsigned long long first, unsigned long long count, std::vector<ISCSIEPMapEntryInfo>& entries);

    /// Puts into `count` how many whole entries the file or device holds after its data start offset, 0 when that lies
    /// at or past the end. Returns 0, or in the order of the checks as getMapEntry(); `count` then keeps its value.
    int getEntryCount(unsigned long long& count);

    std::string toString() const override;

    unsigned int head1Checksum = 0;
    unsigned int attribute = 0;
    unsigned int logicBlockSize = 0;
    unsigned long long totalCount = 0;
    std::string parentUUID;
    unsigned long long parentTotalCount = 0;
    unsigned int var0Checksum = 0;
    unsigned long long mappedCount = 0;
    unsigned int var1Checksum = 0;
    unsigned int seg0Checksum = 0;
    unsigned int seg0PoolCount = 0;  ///< as stored, even above EP_POOL_COUNT_MAX
    std::string sessionUUID;
    unsigned int promoteTime = 0;  ///< seconds since 1970-01-01 00:00:00 UTC, shown as signed
    unsigned int var2Checksum = 0;
    unsigned long long syncCount = 0;
    unsigned int childAttribute = 0;
    std::string trackUUID;
    std::string previousTrackUUID;
    std::string currentTrackUUID;
    std::vector<std::string> poolUUIDs;
};

}  // namespace ISCSI::TOOL
