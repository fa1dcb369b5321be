#include "ISCSILUNConfInfo.h"

#include <kelpiscsiep.h>

#include <algorithm>
#include <cstring>

#include "DumpText.h"
#include "ISCSILUNText.h"
#include "etc/ISCSIQuorinStringTool.h"

namespace ISCSI::TOOL {

namespace {

/// The record that the platform library fills. Its numbers are in the host's byte order; what is not read here is
/// unknown.
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
    unsigned char bytes_[KELPISCSI_LUN_RECORD_SIZE] = {};
};

}  // namespace

ISCSILUNConfInfo::ISCSILUNConfInfo() = default;

ISCSILUNConfInfo::ISCSILUNConfInfo(unsigned int lunId) : lid(lunId) {}

ISCSILUNConfInfo::~ISCSILUNConfInfo() = default;

int ISCSILUNConfInfo::loadFromConfig() {
    LUNRecord record;
    const int error = KELPiSCSILunGetByLid(lid, 0, record.bytes());
    if (error != 0) {
        EP_LOG_ERR(43, "Failed to get LUN config by LUN ID. info: %s. error: %d (%s)", toString().c_str(), error,
                   KELPiSCSIStrError(error));
        return error;
    }
    std::string newUUID = record.text(44);
    std::string newRootPath = record.text(118);
    std::string newName = record.text(4213);
    extentSize = record.number<std::uint32_t>(20);
    size = record.number<std::uint64_t>(24);
    restoreTime = record.number<std::uint32_t>(32);
    type = record.number<std::int32_t>(36);
    uuid.swap(newUUID);
    rootPath.swap(newRootPath);
    name.swap(newName);
    return 0;
}

std::string ISCSILUNConfInfo::toString() const {
    std::string text = "lid: ";
    appendNumber(text, lid);
    appendNumber(text.append(" ,extent_size: "), extentSize);
    text.append(" (").append(GetSizeInString(extentSize)).append(")");
    appendNumber(text.append(" ,size: "), size);
    text.append(" (").append(GetSizeInString(size)).append(")");
    text.append(" ,restore time: ").append(GetTimeInString(restoreTime));
    text.append(" ,type: ").append(GetLUNTypeInString(type));
    text.append(" ,uuid: ").append(uuid);
    text.append(" ,rootpath: ").append(rootPath);
    text.append(" ,name: ").append(name);
    return text;
}

}  // namespace ISCSI::TOOL
