// What the fuzz programs share: the input as a file, claims, and a system log that swallows the lines.
#pragma once

#include <sys/mman.h>
#include <sys/resource.h>
#include <unistd.h>

#include <cstdint>
#include <cstdlib>
#include <string>
#include <vector>

/// Gives way to the program's own, where that is fuzzed.
extern "C" __attribute__((visibility("default"), weak)) void syslog(int /*priority*/, const char* /*format*/, ...) {}

/// Stops what runs wild: after ten seconds for an input, before a file gets larger than 8 MiB, and without showing what
/// it prints. Inputs are as long as they may be from the start: a slow program would not get beyond a few bytes.
/// Options that are typed come later, and count more.
extern "C" int LLVMFuzzerInitialize(int* count, char*** arguments) {
    static char time[] = "-timeout=10", output[] = "-close_fd_mask=3", length[] = "-len_control=0";
    static std::vector<char*> words(*arguments, *arguments + *count);
    words.insert(words.begin() + 1, {time, output, length});
    *count += 3;
    *arguments = words.data();
    const rlimit fileSize = {8U << 20U, RLIM_INFINITY};
    return setrlimit(RLIMIT_FSIZE, &fileSize);
}

inline void require(bool holds) {
    if (!holds) std::abort();
}

/// Puts the input into a file in memory, the same one each time, and returns its path.
inline std::string inputFile(const std::uint8_t* bytes, std::size_t size) {
    static const int descriptor = memfd_create("input", 0);
    require(ftruncate(descriptor, 0) == 0 && pwrite(descriptor, bytes, size, 0) == static_cast<ssize_t>(size));
    return "/proc/self/fd/" + std::to_string(descriptor);
}
