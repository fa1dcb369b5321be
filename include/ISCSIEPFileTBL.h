// The table file of a volume.
#pragma once

#include <string>

#include "ISCSIEPFile.h"

namespace ISCSI::TOOL {

/// A volume's table file ("EP_TBL").
class ISCSI_EP_EXPORT ISCSIEPFileTBL : public ISCSIEPFile {
public:
    ISCSIEPFileTBL();
    explicit ISCSIEPFileTBL(const std::string& filePath);
    ~ISCSIEPFileTBL() override;

    /// Decodes HEAD[0] and HEAD[1], whatever type HEAD[0] names; reads the file at most once.
    /// Returns 0 or a code of parseHead0(); the members below then stay as they were.
    int parseFile();

    std::string toString() const override;

    unsigned int head1Checksum = 0;
    unsigned int extentSize = 0;
    unsigned int entrySize = 0;
    unsigned long long totalCount = 0;
};

}  // namespace ISCSI::TOOL
