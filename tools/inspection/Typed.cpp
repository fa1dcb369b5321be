#include "Typed.h"

#include <algorithm>
#include <charconv>

namespace inspection {

namespace {

/// The number in `digits`; `what` is wrong when it holds none.
Typed<std::uint64_t> parse(std::string_view digits, std::uint64_t most, const char* what) {
    const bool hexadecimal = digits.substr(0, 2) == "0x" || digits.substr(0, 2) == "0X";
    if (hexadecimal) digits.remove_prefix(2);
    std::uint64_t number = 0;
    const char* end = digits.data() + digits.size();
    const auto result = std::from_chars(digits.data(), end, number, hexadecimal ? 16 : 10);
    if (result.ec == std::errc::invalid_argument || result.ptr != end) return what;
    if (result.ec != std::errc() || number > most) return "number out of range";
    return number;
}

/// "FIRST-LAST", or one, each as `take` takes it.
template <typename Take>
Typed<Range> rangeOf(std::string_view text, Take&& take) {
    const auto dash = text.find('-', 1);
    const auto first = take(text.substr(0, dash));
    if (first.fault != nullptr) return first.fault;
    if (dash == std::string_view::npos) return Range{first.value, first.value};
    const auto last = take(text.substr(dash + 1));
    if (last.fault != nullptr) return last.fault;
    if (last.value < first.value) return "range runs backwards";
    return Range{first.value, last.value};
}

}  // namespace

Typed<std::uint64_t> numberIn(std::string_view text, std::uint64_t most) { return parse(text, most, "not a number"); }

Typed<std::uint64_t> sizeIn(std::string_view text, std::uint64_t most) {
    static constexpr std::string_view units = "KMGT";
    const auto start = std::min(text.find_first_of(units), text.size());
    const auto unit = text.substr(start);
    unsigned int shift = 0;
    if (unit.size() == 1 || (unit.size() == 3 && unit.substr(1) == "iB")) {
        shift = static_cast<unsigned int>(10 * (units.find(unit.front()) + 1));
        text.remove_suffix(unit.size());
    }
    auto size = parse(text, most >> shift, "not a size; K, M, G, T, KiB, MiB, GiB or TiB may follow a number");
    size.value <<= shift;
    return size;
}

Typed<Range> rangeIn(std::string_view text, std::uint64_t most) {
    return rangeOf(text, [most](std::string_view part) { return parse(part, most, "not a number, nor FIRST-LAST"); });
}

Typed<Range> sizeRangeIn(std::string_view text, std::uint64_t most) {
    return rangeOf(text, [most](std::string_view part) { return sizeIn(part, most); });
}

}  // namespace inspection
