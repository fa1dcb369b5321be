// What the fuzz programs share: the input as a file, claims, and a system log that swallows the lines.
#pragma once

#include <sys/mman.h>
#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

/// Gives way to the program's own, where that is fuzzed.
extern "C" __attribute__((visibility("default"), weak)) void syslog(int /*priority*/, const char* /*format*/, ...) {}

inline void require(bool holds) {
    if (!holds) std::abort();
}

/// Puts the input into a file in memory, the same one each time, and returns its path.
inline std::string inputFile(const std::uint8_t* bytes, std::size_t size) {
    static const int descriptor = memfd_create("input", 0);
    require(ftruncate(descriptor, 0) == 0 && pwrite(descriptor, bytes, size, 0) == static_cast<ssize_t>(size));
    return "/proc/self/fd/" + std::to_string(descriptor);
}
