#include "store/FileNames.h"

#include <ISCSIEPFile.h>
#include <etc/ISCSIEPFormat.h>

#include <cctype>
#include <charconv>
#include <system_error>

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

/// Whether `text` has the form of a UUID.
bool isUUID(std::string_view text) {
    for (std::size_t i = 0; i < text.size(); ++i) {
        const bool dash = i == 8 || i == 13 || i == 18 || i == 23;
        if (dash ? text[i] != '-' : std::isxdigit(static_cast<unsigned char>(text[i])) == 0) return false;
    }
    return text.size() == 36;
}

/// The number that all of `digits` is.
template <typename Number>
std::optional<Number> numberIn(std::string_view digits) {
    Number number = 0;
    const auto result = std::from_chars(digits.data(), digits.data() + digits.size(), number);
    if (result.ec != std::errc() || result.ptr != digits.data() + digits.size()) return std::nullopt;
    return number;
}

}  // namespace

bool isDataFileName(std::string_view path) {
    static constexpr std::string_view prefix = tool::EP_DAT_FILE_PREFIX;
    return lastName(path).substr(0, prefix.size()) == prefix;
}

std::optional<std::uint64_t> dataFileNumberIn(std::string_view path) {
    if (!isDataFileName(path)) return std::nullopt;
    return numberIn<std::uint64_t>(lastName(path).substr(std::string_view(tool::EP_DAT_FILE_PREFIX).size()));
}

std::string dataFileName(std::uint64_t number) {
    std::string path;
    tool::ISCSIEPFile("/volume1").getDATFilePath(1, number * tool::EP_DAT_FILE_SPAN, path);
    return std::string(lastName(path));
}

bool isMisnamed(std::string_view path) {
    if (!isDataFileName(path)) return false;
    const auto number = dataFileNumberIn(path);
    return !number || lastName(path) != dataFileName(*number);
}

std::optional<MapName> mapNameIn(std::string_view fileName) {
    static constexpr std::string_view end = tool::EP_MAP_NAME_END;
    const auto dash = fileName.find('-');  // no type name holds one: it is the UUID's
    if (dash == std::string_view::npos || dash <= 8 || fileName.size() < dash + 28 + end.size()) return std::nullopt;
    const auto typeName = fileName.substr(0, dash - 8);
    const auto uuid = fileName.substr(typeName.size(), 36);
    fileName.remove_prefix(typeName.size() + uuid.size());
    if (!isUUID(uuid) || fileName.substr(fileName.size() - end.size()) != end) return std::nullopt;
    fileName.remove_suffix(end.size());
    return MapName{std::string(typeName), std::string(uuid), std::string(fileName)};
}

std::uint32_t volumeIn(std::string_view name) {
    static constexpr std::string_view prefix = tool::EP_VOLUME_PREFIX + 1;  // without the slash
    if (name.substr(0, prefix.size()) != prefix) return 0;
    const auto digits = name.substr(prefix.size());
    const bool plain = !digits.empty() && digits[0] >= '1' && digits[0] <= '9';
    return plain ? static_cast<std::uint32_t>(numberIn<std::int32_t>(digits).value_or(0)) : 0;
}

}  // namespace inspection
