// Texts as JSON holds them.
#pragma once

#include <string>
#include <string_view>

namespace inspection {

/// `text` in quotes, plain ASCII. Bytes that are not UTF-8 become U+FFFD.
std::string jsonText(std::string_view text);

bool isUTF8(const std::string& text);

/// The lower-case digits of all bytes: how JSON holds a path that is not UTF-8.
std::string hexOf(std::string_view bytes);

}  // namespace inspection
