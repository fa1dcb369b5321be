#include "Session.h"

#include <sys/stat.h>

#include <cstdlib>
#include <utility>

#include "Output.h"

namespace epinspect {

void Session::setRoot(std::string folder) {
    while (!folder.empty() && folder.back() == '/') folder.pop_back();
    root_ = std::move(folder);
    // The stand-in for the platform's library reads its list from there; another choice in the environment wins.
    setenv("KELPISCSIEP_LUNS", (root_ + "/var/db/iscsi/luns.json").c_str(), 0);
}

std::string Session::targetPath(const std::string& name) const {
    if (root_.empty()) return name;
    if (name.compare(0, root_.size() + 1, root_ + "/") == 0) return name.substr(root_.size());
    return name.compare(0, 1, "/") == 0 ? name : "/" + name;
}

std::optional<std::string> Session::openablePath(const std::string& name) {
    std::string path = root_ + targetPath(name);
    struct stat status = {};
    if (stat(path.c_str(), &status) == 0 && !S_ISREG(status.st_mode) && !S_ISBLK(status.st_mode)) {
        complain(name + ": neither a regular file nor a block device");
        failed = true;
        return std::nullopt;
    }
    return path;
}

bool Session::succeeded(int error, const std::string& subject) {
    if (error == 0) return true;
    complain(subject, error);
    failed = true;
    return false;
}

}  // namespace epinspect
