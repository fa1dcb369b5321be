// A numbered data file of a volume.
#pragma once

#include <string>

#include "ISCSIEPFile.h"

namespace ISCSI::TOOL {

/// A volume's data file ("EP_DAT_" and a number): extents of equal size, back to back from the data start offset.
class ISCSI_EP_EXPORT ISCSIEPFileDAT : public ISCSIEPFile {
public:
    ISCSIEPFileDAT();
    explicit ISCSIEPFileDAT(const std::string& filePath);
    ~ISCSIEPFileDAT() override;

    /// Decodes HEAD[0] and HEAD[1], whatever type HEAD[0] names; reads the file at most once.
    /// Returns 0 or a code of parseHead0(); the members below then stay as they were.
    int parseFile();

    /// Reads extent number `index` (counted from 0, `extentSize` bytes each) and replaces `data` by its bytes as
    /// lower-case hexadecimal text, two characters per byte. Needs no earlier parseFile(). The position is
    /// head0DataStartOffset + `index` * `extentSize`, modulo 2^64.
    /// Returns 0, or in the order of the checks: EP_ERR_BAD_EXTENT_SIZE when `extentSize` is 0, a parseHead0() code,
    /// EP_ERR_WRONG_FILE_TYPE, EP_ERR_OPEN_FAILED, EP_ERR_SEEK_FAILED, EP_ERR_BAD_EXTENT_SIZE when memory cannot hold
    /// the text, EP_ERR_READ_FAILED when the file ends before the extent does. `data` then keeps its content.
    int getExtentData(unsigned long long index, unsigned int extentSize, std::string& data);

    /// Reads `length` bytes of extent number `index`, from `offset` in it, into `bytes` as they are; the extent lies
    /// where getExtentData() finds it. Needs no memory of its own.
    /// Returns 0, or in the order of the checks: EP_ERR_BAD_EXTENT_SIZE when `extentSize` is 0, EP_ERR_BAD_ARGUMENT
    /// when the part is not inside the extent or `bytes` is null with a length, then as getExtentData(). `bytes` keep
    /// their content, but may be partly filled after EP_ERR_READ_FAILED.
    int getExtentBytes(unsigned long long index, unsigned int extentSize, unsigned int offset, unsigned int length,
                       unsigned char* bytes);

    std::string toString() const override;

    unsigned int head1Checksum = 0;
    unsigned int serialNumber = 0;
};

}  // namespace ISCSI::TOOL
