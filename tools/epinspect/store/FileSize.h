// How large a file or block device is.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

namespace epinspect {

/// Its bytes, or nothing when that cannot be told; errno then says why.
std::optional<std::uint64_t> sizeOf(const std::string& path);

}  // namespace epinspect
