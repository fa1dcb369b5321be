// The writer of every dump: the one place that knows banners, tabs and number bases. Numbers never follow a locale.
#pragma once

#include <charconv>
#include <string>
#include <string_view>
#include <utility>

#include "etc/ISCSIQuorinStringTool.h"

namespace ISCSI::TOOL {

/// `value` in plain digits, appended to `text`.
inline void appendNumber(std::string& text, unsigned long long value, int base = 10) {
    char digits[20];
    const auto end = std::to_chars(digits, digits + sizeof digits, value, base).ptr;
    text.append(digits, static_cast<std::string::size_type>(end - digits));
}

class DumpText {
public:
    /// Goes on after `text`; `expected` is about how many bytes will follow.
    explicit DumpText(std::string text, std::string::size_type expected = 512) : text_(std::move(text)) {
        text_.reserve(text_.size() + expected);
    }

    /// A line of 41 characters with the section's name in it; longer where the name has more than 7.
    DumpText& section(std::string_view name) {
        const auto blanks = name.size() < 8 ? 8 - name.size() : 1;
        text_.append(16, '=').append(1, ' ').append(name).append(blanks, ' ').append(16, '=');
        return endLine();
    }

    DumpText& hex(std::string_view name, unsigned long long value) {
        appendNumber(label(name).append("0x"), value, 16);
        return endLine();
    }

    DumpText& dec(std::string_view name, unsigned long long value) {
        appendNumber(label(name), value);
        return endLine();
    }

    DumpText& text(std::string_view name, std::string_view value) {
        label(name).append(value);
        return endLine();
    }

    DumpText& time(std::string_view name, unsigned int seconds) { return text(name, GetTimeInString(seconds)); }

    /// "NAME #NUMBER: VALUE", for the items of a list.
    DumpText& item(std::string_view name, unsigned long long number, std::string_view value) {
        appendNumber(text_.append(name).append(" #"), number);
        text_.append(": ").append(value);
        return endLine();
    }

    std::string str() { return std::move(text_); }

private:
    /// The label, and as many tabs as it takes to column 24, at least one.
    std::string& label(std::string_view name) {
        const auto columns = name.size() + 1;
        return text_.append(name).append(1, ':').append(columns < 24 ? (24 - columns + 7) / 8 : 1, '\t');
    }

    DumpText& endLine() {
        text_.push_back('\n');
        return *this;
    }

    std::string text_;
};

}  // namespace ISCSI::TOOL
