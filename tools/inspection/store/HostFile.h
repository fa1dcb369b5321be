// Reading and writing whole files of this machine. Files of a store are only read.
#pragma once

#include <cstddef>
#include <cstdint>
#include <functional>
#include <string>

#include "store/Descriptor.h"

namespace inspection {

/// Writes all of the bytes. Returns 0 or the errno value.
int writeAt(int file, const char* bytes, std::size_t size, std::uint64_t position);

/// Puts all of the file at `path` into `text`. Returns 0 or the errno value of what failed, EFBIG when it holds more
/// than `most` bytes; `text` may then hold a part.
int readWhole(const std::string& path, std::size_t most, std::string& text);

/// Replaces the file at `path` by one that holds `text`, in one step. Returns 0 or the errno value of what failed.
int writeWhole(const std::string& path, const std::string& text);

/// How a copy ended.
struct CopyEnd {
    enum class How { done, stopped, readFailed, writeFailed };

    How how;
    int reason = 0;  ///< the errno value; 0 of a read: the file ended too early
};

/// Copies the first `size` bytes of `from` to `to`, a new file; holes stay holes. Calls step(position) after
/// each piece of at most 256 KiB; with false it stops the copy.
CopyEnd copySparse(int from, int to, std::uint64_t size, const std::function<bool(std::uint64_t)>& step);

}  // namespace inspection
