#include "ISCSIEPFileTBL.h"

#include "DumpText.h"
#include "EPLayout.h"
#include "LittleEndian.h"
#include "etc/ISCSIEPLog.h"

namespace ISCSI::TOOL {

ISCSIEPFileTBL::ISCSIEPFileTBL() : ISCSIEPFileTBL(std::string()) {}

ISCSIEPFileTBL::ISCSIEPFileTBL(const std::string& filePath) : ISCSIEPFile(filePath) {}

ISCSIEPFileTBL::~ISCSIEPFileTBL() = default;

int ISCSIEPFileTBL::parseFile() {
    const int error = parseHead0();
    if (error != 0) {
        EP_LOG_ERR(41, "Failed to get parse HEAD[0]. path: %s", path.c_str());
        return error;
    }
    const unsigned char* head1 = headerBlock + EP_HEAD1;
    head1Checksum = le32(head1);
    extentSize = le32(head1 + 4);
    entrySize = le32(head1 + 8);
    totalCount = le64(head1 + 12);
    return 0;
}

std::string ISCSIEPFileTBL::toString() const {
    return DumpText(ISCSIEPFile::toString())
        .section("HEAD[1]")
        .hex("checksum", head1Checksum)
        .dec("extent size", extentSize)
        .dec("entry size", entrySize)
        .dec("total count", totalCount)
        .str();
}

}  // namespace ISCSI::TOOL
