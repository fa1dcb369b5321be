// Integers of EP files: little-endian, at any alignment, the same on every host.
#pragma once

#include <cstdint>

namespace ISCSI::TOOL {

inline std::uint32_t le32(const unsigned char* p) {
    return std::uint32_t{p[0]} | std::uint32_t{p[1]} << 8U | std::uint32_t{p[2]} << 16U | std::uint32_t{p[3]} << 24U;
}

inline std::uint64_t le64(const unsigned char* p) { return le32(p) | std::uint64_t{le32(p + 4)} << 32U; }

}  // namespace ISCSI::TOOL
