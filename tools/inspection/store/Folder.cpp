#include "store/Folder.h"

#include <dirent.h>
#include <etc/ISCSIEPDiagnostics.h>

#include <cerrno>
#include <memory>
#include <string_view>

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

struct CloseFolder {
    void operator()(DIR* folder) const { closedir(folder); }
};

Failure cannotBeOpened(const std::string& path, int reason) {
    return {{path, ""}, tool::EP_ERR_OPEN_FAILED, reason, {}};
}

}  // namespace

Failure failureOf(const Located& located, const std::string& path) {
    if (!located.closed.empty()) return cannotBeOpened(located.closed, EACCES);
    return located.obstacle(path).value_or(cannotBeOpened(path, located.error));
}

// By the system's own calls: the standard library's iterator ends the program where memory does not last for a name.
Listing listHere(const std::string& hostPath, const std::string& name) {
    Listing listing;
    const std::unique_ptr<DIR, CloseFolder> folder(opendir(hostPath.c_str()));
    if (folder == nullptr) return {{}, cannotBeOpened(name, errno)};
    for (errno = 0; const dirent* entry = readdir(folder.get()); errno = 0) {  // NOLINT(concurrency-mt-unsafe)
        const std::string_view found = static_cast<const char*>(entry->d_name);
        if (found != "." && found != "..") listing.names.emplace_back(found);
    }
    if (errno != 0) listing.failure = cannotBeOpened(name, errno);
    return listing;
}

Listing listFolder(const Context& context, const std::string& path) {
    const Located located = context.root.locate(path);
    if (located.error == ENOENT && !located.dangling) return {};
    if (!located.isThere()) return {{}, failureOf(located, path)};
    return listHere(located.hostPath, path);
}

}  // namespace inspection
