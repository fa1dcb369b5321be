// What the fuzz programs share: the input as a file, and a system log that swallows the lines.
#pragma once

#include <sys/mman.h>
#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

extern "C" __attribute__((visibility("default"))) void syslog(int /*priority*/, const char* /*format*/, ...) {}

/// A file in memory with the given bytes.
class MemoryFile {
public:
    explicit MemoryFile(const std::vector<std::uint8_t>& bytes) : descriptor_(memfd_create("input", 0)) {
        require(write(descriptor_, bytes.data(), bytes.size()) == static_cast<ssize_t>(bytes.size()));
    }
    MemoryFile(const MemoryFile&) = delete;
    MemoryFile& operator=(const MemoryFile&) = delete;
    ~MemoryFile() { close(descriptor_); }

    std::string path() const { return "/proc/self/fd/" + std::to_string(descriptor_); }

    static void require(bool holds) {
        if (!holds) std::abort();
    }

private:
    int descriptor_;
};
