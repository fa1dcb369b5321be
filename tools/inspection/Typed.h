// Numbers as people type them, for every program: decimal or 0x, nothing before or after.
#pragma once

#include <cstdint>
#include <limits>
#include <string_view>

#include "Range.h"

namespace inspection {

/// The value that a text stands for, or what is wrong with the text.
template <typename Value>
struct Typed {
    Value value{};
    const char* fault = nullptr;  ///< what is wrong; null: nothing

    Typed(Value meant) : value(meant) {}
    Typed(const char* wrong) : fault(wrong) {}
};

inline constexpr std::uint64_t most32Bits = std::numeric_limits<std::uint32_t>::max();
inline constexpr std::uint64_t most64Bits = std::numeric_limits<std::uint64_t>::max();

/// A number of at most `most`.
Typed<std::uint64_t> numberIn(std::string_view text, std::uint64_t most);

/// A number of bytes of at most `most`; K, M, G, T or KiB, MiB, GiB, TiB after it stands for a power of 1024.
Typed<std::uint64_t> sizeIn(std::string_view text, std::uint64_t most);

/// "NUMBER" or "FIRST-LAST", of at most `most`.
Typed<Range> rangeIn(std::string_view text, std::uint64_t most);

/// "SIZE" or "FIRST-LAST", both sizes, of at most `most`.
Typed<Range> sizeRangeIn(std::string_view text, std::uint64_t most);

}  // namespace inspection
