// Text in the making, for lines that are written by the million.
#pragma once

#include <charconv>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>

namespace epinspect {

/// Appends to a buffer that stays from line to line; numbers do not follow the locale.
class Text {
public:
    Text& add(std::string_view text) {
        std::memcpy(room(text.size()), text.data(), text.size());
        size_ += text.size();
        return *this;
    }

    Text& decimal(std::uint64_t number) { return digits(number, 10); }
    Text& hexadecimal(std::uint64_t number) { return add("0x").digits(number, 16); }

    std::string_view view() const { return {buffer_.data(), size_}; }
    void clear() { size_ = 0; }

private:
    Text& digits(std::uint64_t number, int base) {
        constexpr std::size_t longest = 20;
        char* begin = room(longest);
        size_ += static_cast<std::size_t>(std::to_chars(begin, begin + longest, number, base).ptr - begin);
        return *this;
    }

    /// Where the next `count` characters go.
    char* room(std::size_t count) {
        if (buffer_.size() - size_ < count) buffer_.resize(2 * (size_ + count));
        return &buffer_[size_];
    }

    std::string buffer_ = std::string(256, '\0');
    std::size_t size_ = 0;
};

}  // namespace epinspect
