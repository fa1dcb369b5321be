#include "store/HostFile.h"

#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <cstdio>
#include <utility>
#include <vector>

namespace inspection {

namespace {

/// Where the next data starts from `position` on, at most `end`; `position` itself where the system cannot tell.
std::uint64_t nextData(int file, std::uint64_t position, std::uint64_t end) {
    const off_t data = lseek(file, static_cast<off_t>(position), SEEK_DATA);
    if (data < 0) return errno == ENXIO ? end : position;
    return std::min(static_cast<std::uint64_t>(data), end);
}

std::uint64_t nextHole(int file, std::uint64_t position, std::uint64_t end) {
    const off_t hole = lseek(file, static_cast<off_t>(position), SEEK_HOLE);
    return hole < 0 ? end : std::min(static_cast<std::uint64_t>(hole), end);
}

}  // namespace

int writeAt(int file, const char* bytes, std::size_t size, std::uint64_t& position) {
    while (size > 0) {
        const ssize_t written = pwrite(file, bytes, size, static_cast<off_t>(position));
        if (written < 0 && errno == EINTR) continue;
        if (written < 0) return errno;
        bytes += written;
        position += static_cast<std::uint64_t>(written);
        size -= static_cast<std::size_t>(written);
    }
    return 0;
}

int readWhole(const std::string& path, std::size_t most, std::string& text) {
    const Descriptor file(open(path.c_str(), O_RDONLY | O_CLOEXEC));
    if (!file.isOpen()) return errno;
    std::vector<char> block(std::size_t{64} << 10U);
    while (true) {
        const ssize_t got = read(file.number(), block.data(), block.size());
        if (got < 0 && errno == EINTR) continue;
        if (got < 0) return errno;
        if (got == 0) return 0;
        if (static_cast<std::size_t>(got) > most - text.size()) return EFBIG;
        text.append(block.data(), static_cast<std::size_t>(got));
    }
}

int writeWhole(const std::string& path, const std::string& text) {
    const std::string fresh = path + ".new";
    Descriptor file(open(fresh.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666));
    if (!file.isOpen()) return errno;
    std::uint64_t end = 0;
    int error = writeAt(file.number(), text.data(), text.size(), end);
    const int closing = file.close();
    if (error == 0) error = closing;
    if (error == 0 && std::rename(fresh.c_str(), path.c_str()) != 0) error = errno;
    if (error != 0) unlink(fresh.c_str());
    return error;
}

CopyEnd copySparse(int from, int to, std::uint64_t size, const std::function<bool(std::uint64_t)>& step) {
    using How = CopyEnd::How;
    std::vector<char> block(std::size_t{256} << 10U);
    std::uint64_t position = 0;
    std::uint64_t hole = 0;  // where the data at `position` ends
    while (true) {
        if (position >= hole) {
            position = nextData(from, position, size);
            if (position >= size) break;
            hole = nextHole(from, position, size);
        }
        const auto wanted = static_cast<std::size_t>(std::min<std::uint64_t>(hole - position, block.size()));
        const ssize_t got = pread(from, block.data(), wanted, static_cast<off_t>(position));
        if (got < 0 && errno == EINTR) continue;
        if (got <= 0) return {How::readFailed, got < 0 ? errno : 0};
        const int error = writeAt(to, block.data(), static_cast<std::size_t>(got), position);
        if (error != 0) return {How::writeFailed, error};
        if (!step(position)) return {How::stopped, 0};
    }
    if (ftruncate(to, static_cast<off_t>(size)) != 0) return {How::writeFailed, errno};
    return {How::done, 0};
}

}  // namespace inspection
