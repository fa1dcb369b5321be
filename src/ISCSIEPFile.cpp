#include "ISCSIEPFile.h"

#include <cstdlib>
#include <limits>
#include <optional>

#include "DumpText.h"
#include "EPFileStream.h"
#include "EPLayout.h"
#include "ISCSILUNConfInfo.h"
#include "LittleEndian.h"
#include "etc/ISCSIEPFormat.h"
#include "etc/ISCSIEPLog.h"
#include "etc/ISCSIQuorinStringTool.h"

namespace ISCSI::TOOL {

ISCSIEPFile::ISCSIEPFile(const std::string& filePath) : path(filePath) {}

ISCSIEPFile::~ISCSIEPFile() = default;

int ISCSIEPFile::readHeader() {
    EPFileStream stream;
    if (!stream.open(path)) {
        EP_LOG_ERR(37, "Failed to open file. path: %s", path.c_str());
        return EP_ERR_OPEN_FAILED;
    }
    if (!stream.read(headerBlock, sizeof headerBlock)) {
        EP_LOG_ERR(42, "Failed to read file. path: %s", path.c_str());
        return EP_ERR_READ_FAILED;
    }
    return 0;
}

int ISCSIEPFile::parseHead0() {
    if (head0Type == 0) {
        const int error = readHeader();
        if (error != 0) {
            EP_LOG_ERR(59, "Failed to read header. path: %s", path.c_str());
            return error;
        }
    }
    const unsigned char* head0 = headerBlock + EP_HEAD0;
    head0Checksum = le32(head0);
    head0Version = le32(head0 + 4);
    head0MagicCode = le64(head0 + 8);
    head0Type = le32(head0 + 16);
    const int error = GetUUIDInString(head0 + 20, head0UUID);
    if (error != 0) {
        EP_LOG_ERR(80, "Failed to get HEAD[0] UUID. path: %s", path.c_str());
        return error;
    }
    head0DataStartOffset = le64(head0 + 36);
    head0CreateTime = le32(head0 + 44);
    return 0;
}

std::string ISCSIEPFile::toString() const {
    return DumpText({})
        .section("HEAD[0]")
        .hex("checksum", head0Checksum)
        .dec("version", head0Version)
        .hex("magic code", head0MagicCode)
        .dec("type", head0Type)
        .text("UUID", head0UUID)
        .hex("data start offset", head0DataStartOffset)
        .time("create time", head0CreateTime)
        .str();
}

namespace {

/// The whole number that follows "/volume" at the start of `path`; none when there is no such number or when it does
/// not fit a signed 32-bit integer.
std::optional<int> volumeIdIn(const std::string& path) {
    constexpr auto prefixLength = sizeof EP_VOLUME_PREFIX - 1;
    errno = 0;  // the system is not to blame
    if (path.compare(0, prefixLength, EP_VOLUME_PREFIX) != 0) return std::nullopt;
    const char* digits = path.c_str() + prefixLength;
    char* end = nullptr;
    const long long id = std::strtoll(digits, &end, 10);  // ends at its own limits when there are too many digits
    errno = 0;                                            // of those too
    if (end == digits || id < std::numeric_limits<int>::min() || id > std::numeric_limits<int>::max()) {
        return std::nullopt;
    }
    return static_cast<int>(id);
}

std::string volumeFile(int volumeId, const std::string& name) {
    return EP_VOLUME_PREFIX + std::to_string(volumeId) + EP_VOLUME_FOLDER + name;
}

}  // namespace

int ISCSIEPFile::getJNLFilePath(std::string& filePath) const {
    filePath = std::string(EP_JNL_FOLDER) + EP_JNL_FILE_NAME;
    return 0;
}

int ISCSIEPFile::getTBLFilePath(std::string& filePath) const {
    const std::optional<int> id = volumeIdIn(path);
    if (!id) {
        EP_LOG_ERR(106, "Failed to get TBL file path. path: %s", path.c_str());
        return EP_ERR_NO_PATH;
    }
    if (*id <= 0) {
        EP_LOG_ERR(110, "Failed to get volume ID. path: %s", path.c_str());
        return EP_ERR_NO_PATH;
    }
    filePath = volumeFile(*id, EP_TBL_FILE_NAME);
    return 0;
}

int ISCSIEPFile::getFRIFilePath(std::string& filePath) const {
    const std::optional<int> id = volumeIdIn(path);
    if (!id) {
        EP_LOG_ERR(129, "Failed to get FRI file path. path: %s", path.c_str());
        return EP_ERR_NO_PATH;
    }
    if (*id <= 0) {
        EP_LOG_ERR(133, "Failed to get volume ID. path: %s", path.c_str());
        return EP_ERR_NO_PATH;
    }
    filePath = volumeFile(*id, EP_FRI_FILE_NAME);
    return 0;
}

int ISCSIEPFile::getDATFilePath(unsigned int extentSize, unsigned long long extentAddress,
                                std::string& filePath) const {
    const std::optional<int> id = volumeIdIn(path);
    if (!id) {
        EP_LOG_ERR(153, "Failed to get DAT file path. path: %s", path.c_str());
        return EP_ERR_NO_PATH;
    }
    if (*id <= 0) {
        EP_LOG_ERR(157, "Failed to get volume ID. path: %s", path.c_str());
        return EP_ERR_NO_PATH;
    }
    const std::string number = std::to_string(extentSize * extentAddress / EP_DAT_FILE_SPAN);
    const std::string zeros(number.size() < EP_DAT_NUMBER_DIGITS ? EP_DAT_NUMBER_DIGITS - number.size() : 0, '0');
    filePath = volumeFile(*id, EP_DAT_FILE_PREFIX + zeros + number);
    return 0;
}

int ISCSIEPFile::getMAPFilePath(unsigned int lid, std::string& filePath) const {
    ISCSILUNConfInfo lun(lid);
    const int error = lun.loadFromConfig();
    if (error != 0) {
        EP_LOG_ERR(180, "Failed to get LUN conf info. path: %s", path.c_str());
        return error;
    }
    filePath = lun.rootPath + EP_MAP_FOLDER + lun.getTypeName() + lun.uuid + lun.name + EP_MAP_NAME_END;
    return 0;
}

}  // namespace ISCSI::TOOL
