#include "JsonText.h"

#include <etc/ISCSIQuorinStringTool.h>

#include <nlohmann/json.hpp>

namespace inspection {

using nlohmann::json;

std::string jsonText(std::string_view text) { return json(text).dump(-1, ' ', true, json::error_handler_t::replace); }

bool isUTF8(const std::string& text) {
    try {
        static_cast<void>(json(text).dump());
        return true;
    } catch (const json::type_error&) {
        return false;
    }
}

std::string hexOf(std::string_view bytes) {
    std::string digits(2 * bytes.size(), '\0');
    ISCSI::TOOL::PutHexDigits(reinterpret_cast<const unsigned char*>(bytes.data()), bytes.size(), digits.data());
    return digits;
}

}  // namespace inspection
