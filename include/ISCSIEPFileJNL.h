// The journal of the machine.
#pragma once

#include <string>

#include "ISCSIEPFile.h"

namespace ISCSI::TOOL {

/// The machine's journal; getJNLFilePath() gives its path.
class ISCSI_EP_EXPORT ISCSIEPFileJNL : public ISCSIEPFile {
public:
    ISCSIEPFileJNL();
    explicit ISCSIEPFileJNL(const std::string& filePath);
    ~ISCSIEPFileJNL() override;

    /// Decodes HEAD[0], HEAD[1], VAR[0] and VAR[1], whatever type HEAD[0] names; reads the file at most once.
    /// Returns 0 or a code of parseHead0(); the members below then stay as they were.
    int parseFile();

    std::string toString() const override;

    unsigned int head1Checksum = 0;
    unsigned long long totalCount = 0;
    unsigned int var0Checksum = 0;
    unsigned int shutdownTag = 0;
    unsigned int syncCount = 0;
    unsigned int var1Checksum = 0;
    unsigned int lastTransID = 0;
    unsigned long long lastRecordStart = 0;
    unsigned int lastFlushErrno = 0;     ///< shown unsigned, as stored
    unsigned int lastRecoveryError = 0;  ///< shown unsigned, as stored
    unsigned long long emptyRecordStart = 0;
};

}  // namespace ISCSI::TOOL
