// How large a file or block device is, and how much of it lies after its data start.
#pragma once

#include <ISCSIEPFile.h>

#include <cstdint>
#include <optional>
#include <string>
#include <tuple>

namespace inspection {

/// Its size in bytes, or nothing when that cannot be found out; errno then says why.
std::optional<std::uint64_t> sizeOf(const std::string& path);

/// What shows that a file was replaced, or became longer or shorter: device, inode, size.
using FileState = std::tuple<std::uint64_t, std::uint64_t, std::uint64_t>;

/// The state of what lies at `path`; all zero when nothing does.
FileState stateOf(const std::string& path);

/// The bytes from the data start offset of `file`, whose HEAD[0] is decoded, to its end, if it has `size` bytes.
inline std::uint64_t payloadOf(const ISCSI::TOOL::ISCSIEPFile& file, std::uint64_t size) {
    return size > file.head0DataStartOffset ? size - file.head0DataStartOffset : 0;
}

}  // namespace inspection
