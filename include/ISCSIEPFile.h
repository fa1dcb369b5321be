// The part every EP file has in common: its path, its header block, HEAD[0], and where the other EP files lie.
#pragma once

#include <string>

#include "etc/ISCSIEPDiagnostics.h"

namespace ISCSI::TOOL {

/// Bytes of the header block at the start of every EP file.
inline constexpr unsigned int EP_HEADER_BLOCK_SIZE = 24576;

/// HEAD[0] types that the lookups insist on. Other kinds carry values of their own, which are only shown.
inline constexpr unsigned int EP_FILE_TYPE_DAT = 3;
inline constexpr unsigned int EP_FILE_TYPE_MAP = 4;

/// One EP file on disk, named by its path. Complete in itself: it reads and shows HEAD[0] of any kind of EP file.
///
/// An object reads the header block once and keeps that snapshot: a later change of the file is seen by a new object,
/// or after readHeader() and parseHead0(). No file stays open between calls and none is ever written.
/// Nothing read is verified: checksums, magic codes and versions are shown as they stand.
///
/// An object is used by one thread at a time; distinct objects, even for one path, may be used on several threads.
/// Operations that return an int return 0, or an error code when they have logged a failure. The path operations throw
/// nothing but std::bad_alloc, the others nothing at all.
class ISCSI_EP_EXPORT ISCSIEPFile {
public:
    /// Stores `filePath`; every number is 0, every text empty, nothing is read.
    explicit ISCSIEPFile(const std::string& filePath);
    ISCSIEPFile(const ISCSIEPFile&) = delete;
    ISCSIEPFile& operator=(const ISCSIEPFile&) = delete;
    virtual ~ISCSIEPFile();

    /// The dump of the members as they stand, one line each; reads no file. Throws nothing but std::bad_alloc.
    virtual std::string toString() const;

    /// Reads the header block from `path`, each time anew, and decodes nothing.
    /// Returns 0, EP_ERR_OPEN_FAILED, or EP_ERR_READ_FAILED when the file is shorter than the block. After a failure
    /// the decoded members stay; the block holds whatever bytes arrived.
    int readHeader();

    /// Decodes HEAD[0], reading the header block first while `head0Type` is 0.
    /// Returns 0, a code of readHeader() (every member then stays as it was), or EP_ERR_BAD_UUID (the members before
    /// `head0UUID` are then new, the rest as they were).
    int parseHead0();

    /// Puts the path of the machine's journal into `filePath`. Always returns 0; depends on nothing.
    int getJNLFilePath(std::string& filePath) const;

    /// Puts the path of the table file of the volume that `path` names ("/volume" and a number above 0) into
    /// `filePath`. Opens no file. Returns 0, or EP_ERR_NO_PATH; `filePath` then keeps its content.
    int getTBLFilePath(std::string& filePath) const;

    /// The same for the free-index file.
    int getFRIFilePath(std::string& filePath) const;

    /// The same for the data file that holds byte `extentSize` * `extentAddress` (modulo 2^64) of the volume, where
    /// each data file holds 4 TiB.
    int getDATFilePath(unsigned int extentSize, unsigned long long extentAddress, std::string& filePath) const;

    /// Puts the path of the map file of the LUN with id `lid` into `filePath`; the object's own path does not matter.
    /// Returns 0, or a code of ISCSILUNConfInfo::loadFromConfig(); `filePath` then keeps its content.
    int getMAPFilePath(unsigned int lid, std::string& filePath) const;

    const std::string path;
    unsigned char headerBlock[EP_HEADER_BLOCK_SIZE];  ///< meaningful after a successful readHeader() only
    unsigned int head0Checksum = 0;
    unsigned int head0Version = 0;
    unsigned long long head0MagicCode = 0;
    unsigned int head0Type = 0;  ///< 0 also says that HEAD[0] has not been decoded
    std::string head0UUID;
    unsigned long long head0DataStartOffset = 0;  ///< bytes from the start of the file to its entries or extents
    unsigned int head0CreateTime = 0;             ///< seconds since 1970-01-01 00:00:00 UTC, shown as signed
};

}  // namespace ISCSI::TOOL
