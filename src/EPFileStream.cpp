#include "EPFileStream.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>

#include "etc/ISCSIEPLog.h"

namespace ISCSI::TOOL {

static_assert(sizeof(off_t) == 8, "positions of files have 64 bits on every target");

EPFileStream::~EPFileStream() {
    const ErrnoKeeper keeper;
    if (descriptor_ >= 0) ::close(descriptor_);
}

bool EPFileStream::open(const std::string& path) noexcept {
    descriptor_ = ::open(path.c_str(), O_RDONLY | O_CLOEXEC);
    return descriptor_ >= 0;
}

bool EPFileStream::seek(std::uint64_t position) noexcept {
    return ::lseek(descriptor_, static_cast<off_t>(position), SEEK_SET) >= 0;
}

std::optional<std::uint64_t> EPFileStream::seekToEnd() noexcept {
    const off_t end = ::lseek(descriptor_, 0, SEEK_END);
    if (end < 0) return std::nullopt;
    return static_cast<std::uint64_t>(end);
}

std::optional<std::size_t> EPFileStream::readUpTo(unsigned char* bytes, std::size_t size) noexcept {
    constexpr auto largestRequest = std::size_t{1} << 30U;  // whose result fits the system's return value everywhere
    std::size_t got = 0;
    while (got < size) {
        const ssize_t arrived = ::read(descriptor_, bytes + got, std::min(size - got, largestRequest));
        if (arrived == 0) break;
        if (arrived > 0) {
            got += static_cast<std::size_t>(arrived);
        } else if (errno != EINTR) {
            return std::nullopt;
        }
    }
    return got;
}

bool EPFileStream::read(unsigned char* bytes, std::size_t size) noexcept {
    const std::optional<std::size_t> got = readUpTo(bytes, size);
    if (got && *got < size) errno = 0;
    return got == size;
}

}  // namespace ISCSI::TOOL
