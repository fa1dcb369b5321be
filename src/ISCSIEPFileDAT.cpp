#include "ISCSIEPFileDAT.h"

#include <memory>
#include <new>

#include "DumpText.h"
#include "EPLayout.h"
#include "EPLog.h"
#include "EPLookup.h"
#include "LittleEndian.h"
#include "etc/ISCSIQuorinStringTool.h"

namespace ISCSI::TOOL {

namespace {

constexpr EPLookup extentLookup = {
    GetSourceFileName(__FILE__), "getExtentData", EP_FILE_TYPE_DAT, 69, 73, 77, 82, 87,
};

/// Logs an extent size that cannot be used and returns its code.
int unusableExtentSize(const ISCSIEPFile& file, unsigned int extentSize) {
    EP_LOG_ERR_FOR(extentLookup.sourceFile, extentLookup.operation, 65, "Invaild LUN extent size: %d. path: %s",
                   static_cast<int>(extentSize), file.path.c_str());
    return EP_ERR_BAD_EXTENT_SIZE;
}

}  // namespace

ISCSIEPFileDAT::ISCSIEPFileDAT() : ISCSIEPFileDAT(std::string()) {}

ISCSIEPFileDAT::ISCSIEPFileDAT(const std::string& filePath) : ISCSIEPFile(filePath) {}

ISCSIEPFileDAT::~ISCSIEPFileDAT() = default;

int ISCSIEPFileDAT::parseFile() {
    const int error = parseHead0();
    if (error != 0) {
        EP_LOG_ERR(38, "Failed to get parse HEAD[0]. path: %s", path.c_str());
        return error;
    }
    const unsigned char* head1 = headerBlock + EP_HEAD1;
    head1Checksum = le32(head1);
    serialNumber = le32(head1 + 4);
    return 0;
}

int ISCSIEPFileDAT::getExtentData(unsigned long long index, unsigned int extentSize, std::string& data) {
    EPFileStream stream(path);
    if (extentSize == 0) return unusableExtentSize(*this, extentSize);
    const int error = seekToItem(*this, stream, extentLookup, index, extentSize);
    if (error != 0) return error;
    if (2ULL * extentSize > data.max_size()) return unusableExtentSize(*this, extentSize);
    const std::unique_ptr<unsigned char[]> extent(new (std::nothrow) unsigned char[extentSize]);
    if (extent == nullptr) return unusableExtentSize(*this, extentSize);
    if (!stream.read(extent.get(), static_cast<std::streamsize>(extentSize))) return readFailed(*this, extentLookup);
    return GetHexInString(extent.get(), extentSize, data) == 0 ? 0 : unusableExtentSize(*this, extentSize);
}

std::string ISCSIEPFileDAT::toString() const {
    return DumpText(ISCSIEPFile::toString())
        .section("HEAD[1]")
        .hex("checksum", head1Checksum)
        .dec("serial number", serialNumber)
        .str();
}

}  // namespace ISCSI::TOOL
