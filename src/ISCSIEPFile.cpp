#include "ISCSIEPFile.h"

#include <cstdlib>
#include <limits>
#include <optional>
#include <string_view>

#include "DumpText.h"
#include "EPFileStream.h"
#include "EPLayout.h"
#include "EPLog.h"
#include "ISCSILUNConfInfo.h"
#include "ISCSILUNText.h"
#include "LittleEndian.h"
#include "etc/ISCSIQuorinStringTool.h"

namespace ISCSI::TOOL {

ISCSIEPFile::ISCSIEPFile(const std::string& filePath) : path(filePath) {}

ISCSIEPFile::~ISCSIEPFile() = default;

int ISCSIEPFile::readHeader() {
    EPFileStream stream(path);
    if (!stream.isOpen()) {
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
    static constexpr char prefix[] = "/volume";
    constexpr auto prefixLength = sizeof prefix - 1;
    if (path.compare(0, prefixLength, prefix) != 0) return std::nullopt;
    const char* digits = path.c_str() + prefixLength;
    char* end = nullptr;
    const long long id = std::strtoll(digits, &end, 10);  // ends at its own limits when there are too many digits
    if (end == digits || id < std::numeric_limits<int>::min() || id > std::numeric_limits<int>::max()) {
        return std::nullopt;
    }
    return static_cast<int>(id);
}

/// How one of the operations for the files of a volume names itself in the log.
struct VolumeFileLookup {
    const char* operation;
    const char* kind;
    int missingLine, invalidLine;
};

/// Puts the path of `fileName` in the EP folder of the volume that `path` names into `filePath`.
int volumeFilePath(const std::string& path, const VolumeFileLookup& lookup, std::string_view fileName,
                   std::string& filePath) {
    static constexpr const char* sourceFile = GetSourceFileName(__FILE__);
    const std::optional<int> id = volumeIdIn(path);
    if (!id) {
        EP_LOG_ERR_FOR(sourceFile, lookup.operation, lookup.missingLine, "Failed to get %s file path. path: %s",
                       lookup.kind, path.c_str());
        return EP_ERR_NO_PATH;
    }
    if (*id <= 0) {
        EP_LOG_ERR_FOR(sourceFile, lookup.operation, lookup.invalidLine, "Failed to get volume ID. path: %s",
                       path.c_str());
        return EP_ERR_NO_PATH;
    }
    filePath = "/volume" + std::to_string(*id) + "/@iSCSI/EP/" + std::string(fileName);
    return 0;
}

}  // namespace

int ISCSIEPFile::getJNLFilePath(std::string& filePath) const {
    filePath = "/var/db/iscsi/EP_JNL";
    return 0;
}

int ISCSIEPFile::getTBLFilePath(std::string& filePath) const {
    return volumeFilePath(path, {"getTBLFilePath", "TBL", 106, 110}, "EP_TBL", filePath);
}

int ISCSIEPFile::getFRIFilePath(std::string& filePath) const {
    return volumeFilePath(path, {"getFRIFilePath", "FRI", 129, 133}, "EP_FRI", filePath);
}

int ISCSIEPFile::getDATFilePath(unsigned int extentSize, unsigned long long extentAddress,
                                std::string& filePath) const {
    constexpr unsigned int bitsPerFile = 42;  // each data file holds 4 TiB
    const std::string number = std::to_string((extentSize * extentAddress) >> bitsPerFile);
    const std::string zeros(number.size() < 5 ? 5 - number.size() : 0, '0');
    return volumeFilePath(path, {"getDATFilePath", "DAT", 153, 157}, "EP_DAT_" + zeros + number, filePath);
}

int ISCSIEPFile::getMAPFilePath(unsigned int lid, std::string& filePath) const {
    ISCSILUNConfInfo lun(lid);
    const int error = lun.loadFromConfig();
    if (error != 0) {
        EP_LOG_ERR(180, "Failed to get LUN conf info. path: %s", path.c_str());
        return error;
    }
    filePath = lun.rootPath + "/@iSCSI/LUN/" + GetLUNTypeInString(lun.type) + lun.uuid + lun.name + "_00000";
    return 0;
}

}  // namespace ISCSI::TOOL
