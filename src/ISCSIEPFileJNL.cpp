#include "ISCSIEPFileJNL.h"

#include "DumpText.h"
#include "EPLayout.h"
#include "LittleEndian.h"
#include "etc/ISCSIEPLog.h"

namespace ISCSI::TOOL {

ISCSIEPFileJNL::ISCSIEPFileJNL() : ISCSIEPFileJNL(std::string()) {}

ISCSIEPFileJNL::ISCSIEPFileJNL(const std::string& filePath) : ISCSIEPFile(filePath) {}

ISCSIEPFileJNL::~ISCSIEPFileJNL() = default;

int ISCSIEPFileJNL::parseFile() {
    const int error = parseHead0();
    if (error != 0) {
        EP_LOG_ERR(55, "Failed to get parse HEAD[0]. path: %s", path.c_str());
        return error;
    }
    const unsigned char* head1 = headerBlock + EP_HEAD1;
    head1Checksum = le32(head1);
    totalCount = le64(head1 + 4);
    const unsigned char* var0 = headerBlock + EP_VAR0;
    var0Checksum = le32(var0);
    shutdownTag = le32(var0 + 4);
    syncCount = le32(var0 + 8);
    const unsigned char* var1 = headerBlock + EP_VAR1;
    var1Checksum = le32(var1);
    lastTransID = le32(var1 + 4);
    lastRecordStart = le64(var1 + 8);
    lastFlushErrno = le32(var1 + 16);
    lastRecoveryError = le32(var1 + 20);
    emptyRecordStart = le64(var1 + 24);
    return 0;
}

std::string ISCSIEPFileJNL::toString() const {
    return DumpText(ISCSIEPFile::toString())
        .section("HEAD[1]")
        .hex("checksum", head1Checksum)
        .dec("total count", totalCount)
        .section("VAR[0]")
        .hex("checksum", var0Checksum)
        .hex("shutdown tag", shutdownTag)
        .dec("sync count", syncCount)
        .section("VAR[1]")
        .hex("checksum", var1Checksum)
        .dec("last trans ID", lastTransID)
        .dec("last record start", lastRecordStart)
        .dec("last flush errno", lastFlushErrno)
        .dec("last recovery error", lastRecoveryError)
        .dec("empty record start", emptyRecordStart)
        .str();
}

}  // namespace ISCSI::TOOL
