#include "ISCSIEPFileFRI.h"

#include "DumpText.h"
#include "EPLayout.h"
#include "LittleEndian.h"
#include "etc/ISCSIEPLog.h"

namespace ISCSI::TOOL {

ISCSIEPFileFRI::ISCSIEPFileFRI() : ISCSIEPFileFRI(std::string()) {}

ISCSIEPFileFRI::ISCSIEPFileFRI(const std::string& filePath) : ISCSIEPFile(filePath) {}

ISCSIEPFileFRI::~ISCSIEPFileFRI() = default;

int ISCSIEPFileFRI::parseFile() {
    const int error = parseHead0();
    if (error != 0) {
        EP_LOG_ERR(45, "Failed to get parse HEAD[0]. path: %s", path.c_str());
        return error;
    }
    const unsigned char* head1 = headerBlock + EP_HEAD1;
    head1Checksum = le32(head1);
    entrySize = le32(head1 + 4);
    totalGroupCount = le64(head1 + 8);
    const unsigned char* var0 = headerBlock + EP_VAR0;
    var0Checksum = le32(var0);
    totalFreeCount = le64(var0 + 4);
    indexHead = le64(var0 + 12);
    return 0;
}

std::string ISCSIEPFileFRI::toString() const {
    return DumpText(ISCSIEPFile::toString())
        .section("HEAD[1]")
        .hex("checksum", head1Checksum)
        .dec("entry size", entrySize)
        .hex("total group count", totalGroupCount)
        .section("VAR[0]")
        .hex("checksum", var0Checksum)
        .hex("total free count", totalFreeCount)
        .dec("index head", indexHead)
        .str();
}

}  // namespace ISCSI::TOOL
