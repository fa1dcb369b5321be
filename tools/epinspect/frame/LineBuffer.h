// A growing line, for lines that are written by the million.
#pragma once

#include <charconv>
#include <cstddef>
#include <cstdint>
#include <cstring>
#include <string>
#include <string_view>

namespace epinspect {

/// Appends to a buffer that stays from line to line; numbers do not follow the locale.
class LineBuffer {
public:
    template <typename... Pieces>
    LineBuffer& add(const Pieces&... pieces) {
        return addViews(std::string_view(pieces)...);
    }

    LineBuffer& decimal(std::uint64_t number) {
        reserve(longestNumber);
        return to(std::to_chars(end(), end() + longestNumber, number).ptr);
    }

    LineBuffer& hexadecimal(std::uint64_t number) {
        add("0x").reserve(longestNumber);
        return to(std::to_chars(end(), end() + longestNumber, number, 16).ptr);
    }

    std::string_view view() const { return {buffer_.data(), size_}; }
    void clear() { size_ = 0; }

private:
    static constexpr std::size_t longestNumber = 20;

    template <typename... Views>
    LineBuffer& addViews(const Views&... views) {
        reserve((views.size() + ...));
        (append(views), ...);
        return *this;
    }

    /// Needs room for it.
    void append(std::string_view view) {
        std::memcpy(end(), view.data(), view.size());
        size_ += view.size();
    }

    char* end() { return &buffer_[size_]; }

    LineBuffer& to(const char* newEnd) {
        size_ = static_cast<std::size_t>(newEnd - buffer_.data());
        return *this;
    }

    void reserve(std::size_t count) {
        if (buffer_.size() - size_ < count) grow(count);
    }

    [[gnu::noinline]] void grow(std::size_t count) { buffer_.resize(2 * (size_ + count)); }

    std::string buffer_ = std::string(512, '\0');
    std::size_t size_ = 0;
};

}  // namespace epinspect
