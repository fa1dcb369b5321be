// Numbers on the command line: decimal or 0x, nothing before or after. Whatever is off is wrong usage.
#pragma once

#include <cstdint>
#include <string>

#include "Range.h"
#include "frame/Inspection.h"

namespace epinspect {

/// A number of 64 bits. Like the others throws UsageError.
std::uint64_t parseNumber(const std::string& text);

/// A number of 32 bits.
std::uint32_t parseNumber32(const std::string& text);

/// A number of bytes of 64 bits; K, M, G, T or KiB, MiB, GiB, TiB after it stands for a power of 1024.
std::uint64_t parseSize(const std::string& text);

/// A number of bytes of 32 bits.
std::uint32_t parseSize32(const std::string& text);

/// "NUMBER" or "FIRST-LAST", of 64 bits.
Range parseRange(const std::string& text);

/// The same of 32 bits.
Range parseRange32(const std::string& text);

}  // namespace epinspect
