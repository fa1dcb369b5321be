#include "store/FileSize.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

namespace inspection {

std::optional<std::uint64_t> sizeOf(const std::string& path) {
    struct stat status = {};
    if (stat(path.c_str(), &status) != 0) return std::nullopt;
    if (S_ISREG(status.st_mode)) return static_cast<std::uint64_t>(status.st_size);
    const int device = open(path.c_str(), O_RDONLY | O_CLOEXEC);
    if (device < 0) return std::nullopt;
    const off_t end = lseek(device, 0, SEEK_END);
    close(device);
    if (end < 0) return std::nullopt;
    return static_cast<std::uint64_t>(end);
}

FileState stateOf(const std::string& path) {
    struct stat status = {};
    if (stat(path.c_str(), &status) != 0) return {};
    return {status.st_dev, status.st_ino, static_cast<std::uint64_t>(status.st_size)};
}

}  // namespace inspection
