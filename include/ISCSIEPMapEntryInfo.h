// One entry of a map file.
#pragma once

#include <string>

#include "etc/ISCSIEPDiagnostics.h"

namespace ISCSI::TOOL {

/// The decoded map entry of one index: a plain value, whose small members are inline so that lists of entries cost
/// nothing extra.
class ISCSI_EP_EXPORT ISCSIEPMapEntryInfo {
public:
    /// An entry of all zero bits.
    ISCSIEPMapEntryInfo() = default;
    ISCSIEPMapEntryInfo(unsigned long long entryExtentAddress, unsigned int entryPoolNumber, bool isMapped,
                        bool isVPushed, bool isVPulled, bool isSynced)
        : extentAddress(entryExtentAddress),
          poolNumber(entryPoolNumber),
          mapped(isMapped),
          vpushed(isVPushed),
          vpulled(isVPulled),
          synced(isSynced) {}
    ISCSIEPMapEntryInfo(const ISCSIEPMapEntryInfo&) = default;
    ISCSIEPMapEntryInfo& operator=(const ISCSIEPMapEntryInfo&) = default;
    virtual ~ISCSIEPMapEntryInfo() = default;

    /// The entry as one line, its line feed included. Throws nothing but std::bad_alloc.
    std::string toString() const;

    unsigned long long extentAddress = 0;
    unsigned int poolNumber = 0;
    bool mapped = false;
    bool vpushed = false;
    bool vpulled = false;
    bool synced = false;
};

}  // namespace ISCSI::TOOL
