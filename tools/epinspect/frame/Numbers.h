// Numbers on the command line. Whatever is wrong with one is wrong usage.
#pragma once

#include <cstdint>
#include <string>

#include "Typed.h"
#include "frame/Inspection.h"
#include "frame/UsageError.h"

namespace epinspect {

/// What was typed. Throws UsageError.
template <typename Value>
Value meant(const Typed<Value>& typed) {
    if (typed.fault != nullptr) throw UsageError{typed.fault};
    return typed.value;
}

/// A number of 64 bits. Like the others throws UsageError.
std::uint64_t parseNumber(const std::string& text);

/// A number of 32 bits.
std::uint32_t parseNumber32(const std::string& text);

/// A number of bytes of 64 bits.
std::uint64_t parseSize(const std::string& text);

/// "NUMBER" or "FIRST-LAST", of 64 bits.
Range parseRange(const std::string& text);

/// The same of positions in a file, below 2^63; K, M, G, T may follow.
Range parsePositions(const std::string& text);

/// "NUMBER" or "FIRST-LAST", of 32 bits.
Range parseRange32(const std::string& text);

}  // namespace epinspect
