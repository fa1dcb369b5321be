// The writer of the one-line texts of a map entry and of a LUN: "label: value ,label: value".
#pragma once

#include <string>
#include <string_view>
#include <utility>

#include "DumpText.h"

namespace ISCSI::TOOL {

class LineText {
public:
    LineText& text(std::string_view name, std::string_view value) {
        label(name).append(value);
        return *this;
    }

    LineText& dec(std::string_view name, unsigned long long value) {
        appendNumber(label(name), value);
        return *this;
    }

    /// "VALUE (TEXT)".
    LineText& dec(std::string_view name, unsigned long long value, std::string_view inOtherWords) {
        dec(name, value);
        text_.append(" (").append(inOtherWords).append(1, ')');
        return *this;
    }

    LineText& truth(std::string_view name, bool value) { return text(name, value ? "true" : "false"); }

    std::string str() { return std::move(text_); }

private:
    std::string& label(std::string_view name) {
        if (!text_.empty()) text_.append(" ,");
        return text_.append(name).append(": ");
    }

    std::string text_;
};

}  // namespace ISCSI::TOOL
