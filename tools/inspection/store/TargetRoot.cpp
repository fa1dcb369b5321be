#include "store/TargetRoot.h"

#include <etc/ISCSIEPDiagnostics.h>
#include <sys/stat.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <string_view>

#include "store/PathWalk.h"

namespace inspection {

namespace fs = std::filesystem;
namespace tool = ISCSI::TOOL;

namespace {

Failure cannotBeOpened(const std::string& name, const char* why) {
    return {{name, ""}, tool::EP_ERR_OPEN_FAILED, 0, std::string("cannot be opened: ") + why};
}

/// By the system's own walk.
Located locatedBySystem(const std::string& hostPath) {
    Located located;
    located.hostPath = hostPath;
    struct stat status = {};
    if (stat(hostPath.c_str(), &status) != 0) {
        located.error = errno;
    } else {
        located.mode = status.st_mode;
        located.identity = {status.st_dev, status.st_ino};
    }
    return located;
}

}  // namespace

bool Located::isMissing() const { return !leadsOut && (error == ENOENT || error == ENOTDIR); }

bool Located::isFolder() const { return isThere() && S_ISDIR(mode); }

std::optional<Failure> Located::obstacle(const std::string& name) const {
    if (leadsOut) return cannotBeOpened(name, "a link leads out of the folder of --root");
    if (error == 0 || isMissing()) return std::nullopt;
    return Failure{{name, ""}, tool::EP_ERR_OPEN_FAILED, error, {}};
}

std::optional<Failure> Located::obstacleToFile(const std::string& name) const {
    if (!isThere() || S_ISREG(mode) || S_ISBLK(mode)) return obstacle(name);
    return cannotBeOpened(name, isFolder() ? "is a folder, not a file" : "neither a regular file nor a block device");
}

std::error_code TargetRoot::set(const std::string& folder) {
    const Located located = locatedBySystem(folder);
    if (located.error != 0) return {located.error, std::generic_category()};
    if (!located.isFolder()) return std::make_error_code(std::errc::not_a_directory);
    identity_ = located.identity;
    root_ = folder;
    while (!root_.empty() && root_.back() == '/') root_.pop_back();
    return {};
}

const std::string& TargetRoot::folder() const {
    static const std::string top = "/";
    return root_.empty() ? top : root_;
}

std::string TargetRoot::targetPath(const std::string& name) const {
    std::error_code error;
    const std::string absolute = fs::absolute(name, error).string();
    if (!isFolder()) return error ? name : plainPath(absolute);
    // Below the root folder is what has it among the folders above, under whatever name.
    for (auto end = absolute.find('/'); end != std::string::npos; end = absolute.find('/', end + 1)) {
        if (identityOf(absolute.substr(0, end + 1)) != identity_) continue;
        bool climbs = false;
        std::string below = plain(absolute.substr(end), &climbs);
        if (!climbs) return below;
    }
    if (identityOf(absolute) == identity_) return "/";
    return plainPath(name);
}

std::string TargetRoot::plain(const std::string& path, bool* climbs) const {
    std::string result;
    for (std::string_view rest = path; !rest.empty();) {
        const auto end = std::min(rest.find('/'), rest.size());
        const std::string_view name = rest.substr(0, end);
        rest.remove_prefix(std::min(rest.size(), end + 1));
        if (name.empty() || name == ".") continue;
        if (name != "..") {
            result.append("/").append(name);
            continue;
        }
        if (result.empty()) {
            if (climbs != nullptr) *climbs = true;
            continue;
        }
        PathEnd above = walkPath(folder(), result, LastLink::keep);
        const bool isLink = !above.link.empty();
        if (isLink) above = walkPath(folder(), result, LastLink::follow);
        if (above.error != 0 || above.leadsOut || !S_ISDIR(above.mode)) {
            result += "/..";
        } else {
            if (isLink) result = above.path;
            result.erase(result.rfind('/'));
        }
    }
    if (result.empty() || path.back() == '/') result += '/';  // which only a folder has at its end
    return result;
}

Located TargetRoot::locate(const std::string& path) const {
    if (!isFolder()) {
        Located located = locatedBySystem(path.substr(0, 1) == "/" ? path : "/" + path);
        if (located.error == 0) return located;
        const PathEnd end = walkPath(folder(), path, LastLink::follow);
        located.dangling = end.dangling;
        located.closed = end.closed;
        return located;
    }
    const PathEnd end = walkPath(folder(), path, LastLink::follow);
    const bool isThere = end.error == 0 && !end.leadsOut;
    return {root_ + end.path, end.error, end.leadsOut, end.dangling, end.closed, isThere ? end.mode : 0, end.identity};
}

Located TargetRoot::locateNamed(const std::string& name) const {
    return isFolder() ? locate(targetPath(name)) : locatedBySystem(name);
}

std::optional<std::string> TargetRoot::linkAt(const std::string& path) const {
    const PathEnd end = walkPath(folder(), path, LastLink::keep);
    return end.link.empty() ? std::nullopt : std::optional(end.link);
}

}  // namespace inspection
