// Numbers on the command line: decimal or 0x, nothing before or after. Whatever is off is wrong usage.
#pragma once

#include <cstdint>
#include <string>

namespace epinspect {

/// A number of 64 bits. Like the others throws CLI::ValidationError.
std::uint64_t parseNumber(const std::string& text);

/// A number of 32 bits.
std::uint32_t parseNumber32(const std::string& text);

/// A number of bytes of 32 bits; K, M or G after it stands for a power of 1024.
std::uint32_t parseSize(const std::string& text);

/// Indexes from `first` to `last`, both included.
struct IndexRange {
    std::uint64_t first;
    std::uint64_t last;
};

/// "INDEX" or "FIRST-LAST".
IndexRange parseIndexRange(const std::string& text);

}  // namespace epinspect
