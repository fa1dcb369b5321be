#include "ISCSILUNConfInfo.h"

#include <kelpiscsiep.h>

#include <algorithm>
#include <cstddef>
#include <cstring>

#include "ISCSILUNText.h"
#include "LineText.h"
#include "etc/ISCSIEPLog.h"
#include "etc/ISCSIQuorinStringTool.h"

namespace ISCSI::TOOL {

namespace {

/// The record that the platform library fills, aligned as the structure that it is to that library. Its numbers are in
/// the host's byte order; what is not read here is unknown.
class LUNRecord {
public:
    unsigned char* bytes() { return bytes_; }

    template <typename Number>
    Number number(std::size_t offset) const {
        Number value;
        std::memcpy(&value, bytes_ + offset, sizeof value);
        return value;
    }

    /// The text at `offset` up to its first NUL, at most to the end of the record.
    std::string text(std::size_t offset) const {
        const unsigned char* begin = bytes_ + offset;
        return {begin, std::find(begin, bytes_ + sizeof bytes_, '\0')};
    }

private:
    alignas(std::max_align_t) unsigned char bytes_[KELPISCSI_LUN_RECORD_SIZE] = {};
};

}  // namespace

ISCSILUNConfInfo::ISCSILUNConfInfo() = default;

ISCSILUNConfInfo::ISCSILUNConfInfo(unsigned int lunId) : lid(lunId) {}

ISCSILUNConfInfo::~ISCSILUNConfInfo() = default;

int ISCSILUNConfInfo::loadFromConfig() {
    LUNRecord record;
    errno = 0;
    const int error = KELPiSCSILunGetByLid(lid, 0, record.bytes());
    if (error != 0) {
        const ErrnoKeeper keeper;
        const char* text = KELPiSCSIStrError(error);
        EP_LOG_ERR(43, "Failed to get LUN config by LUN ID. info: %s. error: %d (%s)", toString().c_str(), error,
                   text != nullptr ? text : "no text");
        return error;
    }
    std::string newUUID = record.text(KELPISCSI_LUN_UUID);
    std::string newRootPath = record.text(KELPISCSI_LUN_ROOT_PATH);
    std::string newName = record.text(KELPISCSI_LUN_NAME);
    extentSize = record.number<std::uint32_t>(KELPISCSI_LUN_EXTENT_SIZE);
    size = record.number<std::uint64_t>(KELPISCSI_LUN_SIZE);
    restoreTime = record.number<std::uint32_t>(KELPISCSI_LUN_RESTORE_TIME);
    type = record.number<std::int32_t>(KELPISCSI_LUN_TYPE);
    uuid.swap(newUUID);
    rootPath.swap(newRootPath);
    name.swap(newName);
    return 0;
}

std::string ISCSILUNConfInfo::getErrorText(int error) {
    const ErrnoKeeper keeper;
    const char* text = KELPiSCSIStrError(error);
    return text != nullptr ? text : "";
}

std::string ISCSILUNConfInfo::getTypeName() const { return GetLUNTypeInString(type); }

std::string ISCSILUNConfInfo::toString() const {
    return LineText()
        .dec("lid", lid)
        .dec("extent_size", extentSize, GetSizeInString(extentSize))
        .dec("size", size, GetSizeInString(size))
        .text("restore time", GetTimeInString(restoreTime))
        .text("type", getTypeName())
        .text("uuid", uuid)
        .text("rootpath", rootPath)
        .text("name", name)
        .str();
}

}  // namespace ISCSI::TOOL
