// The free-index file of a volume.
#pragma once

#include <string>

#include "ISCSIEPFile.h"

namespace ISCSI::TOOL {

/// A volume's free-index file ("EP_FRI").
class ISCSI_EP_EXPORT ISCSIEPFileFRI : public ISCSIEPFile {
public:
    ISCSIEPFileFRI();
    explicit ISCSIEPFileFRI(const std::string& filePath);
    ~ISCSIEPFileFRI() override;

    /// Decodes HEAD[0], HEAD[1] and VAR[0], whatever type HEAD[0] names; reads the file at most once.
    /// Returns 0 or a code of parseHead0(); the members below then stay as they were.
    int parseFile();

    std::string toString() const override;

    unsigned int head1Checksum = 0;
    unsigned int entrySize = 0;
    unsigned long long totalGroupCount = 0;
    unsigned int var0Checksum = 0;
    unsigned long long totalFreeCount = 0;
    unsigned long long indexHead = 0;
};

}  // namespace ISCSI::TOOL
