#include "store/FileIdentity.h"

#include <sys/stat.h>

namespace inspection {

std::optional<FileIdentity> identityOf(const std::string& hostPath) {
    struct stat status = {};
    if (stat(hostPath.c_str(), &status) != 0) return std::nullopt;
    return FileIdentity{status.st_dev, status.st_ino};
}

}  // namespace inspection
