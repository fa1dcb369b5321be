// What the lookups beyond the header block have in common: the way to the item they read, and how each step fails.
#pragma once

#include <cstdint>

#include "EPFileStream.h"
#include "ISCSIEPFile.h"

namespace ISCSI::TOOL {

/// How one lookup names itself in the log, and the type of file it insists on.
struct EPLookup {
    const char* sourceFile;
    const char* operation;
    unsigned int fileType;
    int headerLine, typeLine, openLine, seekLine, readLine;
};

/// Decodes HEAD[0] of `file` unless that is done, tests its type, then whether `stream` (opened by the caller on the
/// same path) is open, and goes to item `index` of `itemSize` bytes. Returns 0 or the code of the failure it logged.
int seekToItem(ISCSIEPFile& file, EPFileStream& stream, const EPLookup& lookup, std::uint64_t index,
               std::uint32_t itemSize);

/// Logs the failed read of a lookup and returns its code.
int readFailed(const ISCSIEPFile& file, const EPLookup& lookup);

}  // namespace ISCSI::TOOL
