#include "check/VolumeData.h"

#include <ISCSIEPFileDAT.h>

#include <charconv>
#include <filesystem>

#include "SystemLog.h"
#include "store/FileSize.h"
#include "store/Folder.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

/// The path of the data file `number` of the volume on which `path` lies, empty where that names none.
std::string dataFilePath(const std::string& path, std::uint64_t number) {
    constexpr unsigned int shift = 42;  // a data file for each 4 TiB
    const QuietLog quiet;
    std::string result;
    tool::ISCSIEPFile(path).getDATFilePath(1, number << shift, result);
    return result;
}

std::string_view lastName(std::string_view path) { return path.substr(path.rfind('/') + 1); }

}  // namespace

std::optional<std::uint64_t> dataFileNumberIn(std::string_view path) {
    static constexpr std::string_view prefix = "EP_DAT_";
    const auto name = lastName(path);
    if (name.substr(0, prefix.size()) != prefix) return std::nullopt;
    const auto digits = name.substr(prefix.size());
    std::uint64_t number = 0;
    const auto result = std::from_chars(digits.data(), digits.data() + digits.size(), number);
    if (result.ec != std::errc() || result.ptr != digits.data() + digits.size()) return std::nullopt;
    return number;
}

VolumeData::VolumeData(Session& session, const std::string& path, bool reports) : session_(session), reports_(reports) {
    const std::string first = dataFilePath(path, 0);
    folder_ = first.substr(0, first.rfind('/') + 1);
    if (haveVolume()) list();
}

void VolumeData::list() {
    const auto error = listFolder(session_, folder_, [this](const std::filesystem::directory_entry& entry) {
        const std::string name = entry.path().filename().string();
        const auto number = dataFileNumberIn(name);
        if (!number || name != nameOf(*number)) return;
        std::error_code unknown;
        const bool canBeRead = entry.is_regular_file(unknown) || entry.is_block_file(unknown);
        File& file = files_[*number];
        if (!canBeRead && !reports_) file.state = State::unreadable;
    });
    listed_ = !error;
    if (error && reports_) session_.succeeded(tool::EP_ERR_OPEN_FAILED, {folder_, ""}, error.value());
}

std::string VolumeData::nameOf(std::uint64_t number) { return std::string(lastName(dataFilePath("/volume1", number))); }

VolumeData::State VolumeData::find(std::uint64_t number, std::uint64_t& bytes) {
    const auto file = files_.find(number);
    if (file == files_.end()) return State::missing;
    if (!file->second.state) look(number, file->second);
    bytes = file->second.bytes;
    return *file->second.state;
}

void VolumeData::look(std::uint64_t number, File& file) {
    file.state = State::unreadable;
    const std::string name = folder_ + nameOf(number);
    const std::optional<std::string> path = session_.openablePath(name);
    if (!path) return;
    tool::ISCSIEPFileDAT content(*path);
    const int error = content.parseHead0();
    if (reports_) session_.succeeded(error, {name, ""});
    const auto size = sizeOf(*path);
    if (error != 0 || !size) return;
    file.state = State::readable;
    file.bytes = *size > content.head0DataStartOffset ? *size - content.head0DataStartOffset : 0;
}

}  // namespace epinspect
