#include "frame/Numbers.h"

#include <algorithm>
#include <charconv>
#include <limits>
#include <string_view>

#include "frame/UsageError.h"

namespace epinspect {

namespace {

constexpr std::uint64_t limit64 = std::numeric_limits<std::uint64_t>::max();
constexpr std::uint64_t limit32 = std::numeric_limits<std::uint32_t>::max();

/// The number that `digits` is, at most `limit`; `what` it should have been.
std::uint64_t numberIn(std::string_view digits, std::uint64_t limit, const char* what) {
    const bool hexadecimal = digits.substr(0, 2) == "0x" || digits.substr(0, 2) == "0X";
    if (hexadecimal) digits.remove_prefix(2);
    std::uint64_t number = 0;
    const char* end = digits.data() + digits.size();
    const auto result = std::from_chars(digits.data(), end, number, hexadecimal ? 16 : 10);
    if (result.ec == std::errc::invalid_argument || result.ptr != end) throw UsageError{what};
    if (result.ec != std::errc() || number > limit) throw UsageError{"number out of range"};
    return number;
}

std::uint64_t sizeIn(std::string_view text, std::uint64_t limit) {
    static constexpr std::string_view units = "KMGT";
    const auto start = std::min(text.find_first_of(units), text.size());
    const auto unit = text.substr(start);
    unsigned int shift = 0;
    if (unit.size() == 1 || (unit.size() == 3 && unit.substr(1) == "iB")) {
        shift = static_cast<unsigned int>(10 * (units.find(unit.front()) + 1));
        text.remove_suffix(unit.size());
    }
    return numberIn(text, limit >> shift, "not a size; K, M, G, T, KiB, MiB, GiB or TiB may follow a number") << shift;
}

Range rangeIn(std::string_view text, std::uint64_t limit) {
    static constexpr const char* what = "not a number, nor FIRST-LAST";
    const auto dash = text.find('-', 1);
    const auto first = numberIn(text.substr(0, dash), limit, what);
    if (dash == std::string_view::npos) return {first, first};
    const auto last = numberIn(text.substr(dash + 1), limit, what);
    if (last < first) throw UsageError{"range runs backwards"};
    return {first, last};
}

}  // namespace

std::uint64_t parseNumber(const std::string& text) { return numberIn(text, limit64, "not a number"); }

std::uint32_t parseNumber32(const std::string& text) {
    return static_cast<std::uint32_t>(numberIn(text, limit32, "not a number"));
}

std::uint64_t parseSize(const std::string& text) { return sizeIn(text, limit64); }

std::uint32_t parseSize32(const std::string& text) { return static_cast<std::uint32_t>(sizeIn(text, limit32)); }

Range parseRange(const std::string& text) { return rangeIn(text, limit64); }

Range parseRange32(const std::string& text) { return rangeIn(text, limit32); }

}  // namespace epinspect
