#include "Numbers.h"

#include <CLI/Error.hpp>
#include <charconv>
#include <limits>
#include <string_view>

namespace epinspect {

namespace {

constexpr std::uint64_t limit32 = std::numeric_limits<std::uint32_t>::max();

[[noreturn]] void unusable(const std::string& text, const char* what) {
    throw CLI::ValidationError("'" + text + "'", what);
}

/// The number that `digits` is, at most `limit`; complains about `text`, of which it is a part.
std::uint64_t numberIn(std::string_view digits, std::uint64_t limit, const std::string& text) {
    const bool hexadecimal = digits.substr(0, 2) == "0x" || digits.substr(0, 2) == "0X";
    if (hexadecimal) digits.remove_prefix(2);
    std::uint64_t number = 0;
    const char* end = digits.data() + digits.size();
    const auto result = std::from_chars(digits.data(), end, number, hexadecimal ? 16 : 10);
    if (result.ec == std::errc::invalid_argument || result.ptr != end) unusable(text, "not a number");
    if (result.ec != std::errc() || number > limit) unusable(text, "number out of range");
    return number;
}

}  // namespace

std::uint64_t parseNumber(const std::string& text) {
    return numberIn(text, std::numeric_limits<std::uint64_t>::max(), text);
}

std::uint32_t parseNumber32(const std::string& text) {
    return static_cast<std::uint32_t>(numberIn(text, limit32, text));
}

std::uint32_t parseSize(const std::string& text) {
    static constexpr std::string_view units = "KMG";
    const auto unit = text.empty() ? std::string_view::npos : units.find(text.back());
    if (unit == std::string_view::npos) return parseNumber32(text);
    const auto shift = static_cast<unsigned int>(10 * (unit + 1));
    const std::string_view digits(text.data(), text.size() - 1);
    return static_cast<std::uint32_t>(numberIn(digits, limit32 >> shift, text) << shift);
}

IndexRange parseIndexRange(const std::string& text) {
    constexpr auto limit = std::numeric_limits<std::uint64_t>::max();
    const std::string_view whole = text;
    const auto dash = whole.find('-');
    const auto first = numberIn(whole.substr(0, dash), limit, text);
    if (dash == std::string_view::npos) return {first, first};
    const auto last = numberIn(whole.substr(dash + 1), limit, text);
    if (last < first) unusable(text, "range runs backwards");
    return {first, last};
}

}  // namespace epinspect
