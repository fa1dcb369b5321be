#include "frame/Numbers.h"

namespace epinspect {

std::uint64_t parseNumber(const std::string& text) { return meant(numberIn(text, most64Bits)); }

std::uint32_t parseNumber32(const std::string& text) {
    return static_cast<std::uint32_t>(meant(numberIn(text, most32Bits)));
}

std::uint64_t parseSize(const std::string& text) { return meant(sizeIn(text, most64Bits)); }

Range parseRange(const std::string& text) { return meant(rangeIn(text, most64Bits)); }

Range parsePositions(const std::string& text) { return meant(sizeRangeIn(text, most64Bits / 2)); }

Range parseRange32(const std::string& text) { return meant(rangeIn(text, most32Bits)); }

}  // namespace epinspect
