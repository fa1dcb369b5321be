#include "store/TargetRoot.h"

#include <sys/stat.h>

#include <filesystem>

namespace inspection {

namespace fs = std::filesystem;

namespace {

constexpr const char* leadsOutText = "a link leads out of the folder of --root";

}  // namespace

std::error_code TargetRoot::set(const std::string& folder) {
    std::error_code error;
    if (!fs::is_directory(folder, error)) return error ? error : std::make_error_code(std::errc::not_a_directory);
    const std::string canonical = fs::canonical(folder, error).string();
    if (error) return error;
    canonical_ = canonical;
    root_ = folder;
    while (!root_.empty() && root_.back() == '/') root_.pop_back();
    return {};
}

std::string TargetRoot::targetPath(const std::string& name) const {
    std::error_code error;
    const fs::path absolute = fs::absolute(name, error);
    if (error) return name;
    if (!isFolder()) return absolute.lexically_normal().string();
    // Below the root folder is what has it among the folders above, under whatever name.
    fs::path above;
    for (auto piece = absolute.begin(); piece != absolute.end(); ++piece) {
        above /= *piece;
        if (!fs::equivalent(above, canonical_, error)) continue;
        fs::path below = "/";
        while (++piece != absolute.end()) below /= *piece;
        return below.lexically_normal().string();
    }
    return (fs::path("/") / name).lexically_normal().string();
}

bool TargetRoot::exists(const std::string& path) const {
    std::error_code error;
    return fs::exists(hostPath(path), error) && !leadsOut(hostPath(path));
}

bool TargetRoot::leadsOut(const std::string& hostPath) const {
    std::error_code error;
    const std::string canonical = fs::canonical(hostPath, error).string();
    if (!isFolder() || canonical_ == "/" || error) return false;
    return canonical != canonical_ && canonical.compare(0, canonical_.size() + 1, canonical_ + "/") != 0;
}

const char* TargetRoot::refusalOfFile(const std::string& hostPath) const {
    struct stat status = {};
    if (leadsOut(hostPath)) return leadsOutText;
    const bool there = stat(hostPath.c_str(), &status) == 0;
    return there && !S_ISREG(status.st_mode) && !S_ISBLK(status.st_mode) ? "neither a regular file nor a block device"
                                                                         : nullptr;
}

const char* TargetRoot::refusalOfFolder(const std::string& hostPath) const {
    return leadsOut(hostPath) ? leadsOutText : nullptr;
}

}  // namespace inspection
