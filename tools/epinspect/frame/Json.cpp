#include "frame/Json.h"

#include <etc/ISCSIQuorinStringTool.h>

#include <nlohmann/json.hpp>

#include "frame/Output.h"

namespace epinspect {

namespace {

std::string escaped(std::string_view text) {
    return nlohmann::json(text).dump(-1, ' ', true, nlohmann::json::error_handler_t::replace);
}

bool isUTF8(const std::string& text) {
    try {
        static_cast<void>(nlohmann::json(text).dump());
        return true;
    } catch (const nlohmann::json::type_error&) {
        return false;
    }
}

/// The members that tell a path: "NAME", and "NAMEHex" where it is not UTF-8.
std::string pathMembers(const std::string& name, const std::string& path) {
    std::string members = "\"" + name + "\":" + escaped(path);
    if (isUTF8(path)) return members;
    std::string digits(2 * path.size(), '\0');
    ISCSI::TOOL::PutHexDigits(reinterpret_cast<const unsigned char*>(path.data()), path.size(), digits.data());
    return members.append(",\"").append(name).append("Hex\":\"").append(digits).append("\"");
}

}  // namespace

Json::Json(const std::string& file, const std::vector<std::uint32_t>& lids)
    : file_(file.empty() ? R"("file":null)" : pathMembers("file", file)) {
    if (!lids.empty()) file_ += ",\"lid\":" + std::to_string(lids.front());
    if (lids.size() > 1) file_ += ",\"lids\":" + nlohmann::json(lids).dump();
}

Json& Json::begin(const char* kind) {
    line_.clear();
    line_.add(R"({"kind":")", kind, "\",", file_);
    inner_ = true;
    return *this;
}

void Json::end() {
    line_.add("}\n");
    print(line_.view());
}

Json& Json::number(std::string_view name, std::uint64_t value) {
    anyKey(name);
    line_.decimal(value);
    return *this;
}

Json& Json::hexadecimal(std::string_view name, std::uint64_t value) {
    anyKey(name);
    line_.add("\"").hexadecimal(value).add("\"");
    return *this;
}

Json& Json::text(std::string_view name, std::string_view value) {
    anyKey(name);
    line_.add(escaped(value));
    return *this;
}

Json& Json::path(const std::string& name, const std::string& value) { return ready(pathMembers(name, value)); }

Json& Json::texts(std::string_view name, const std::vector<std::string>& values) {
    beginList(name);
    for (const std::string& value : values) {
        anyKey({});
        line_.add(escaped(value));
    }
    return endList();
}

Json& Json::ready(std::string_view members) {
    line_.add(inner_ ? "," : "", members);
    inner_ = true;
    return *this;
}

Json& Json::beginObject(std::string_view name) {
    anyKey(name);
    line_.add("{");
    inner_ = false;
    return *this;
}

Json& Json::endObject() {
    line_.add("}");
    inner_ = true;
    return *this;
}

Json& Json::beginList(std::string_view name) {
    anyKey(name);
    line_.add("[");
    inner_ = false;
    return *this;
}

Json& Json::endList() {
    line_.add("]");
    inner_ = true;
    return *this;
}

void Json::anyKey(std::string_view name) {
    if (inner_) line_.add(",");
    inner_ = true;
    if (!name.empty()) line_.add("\"", name, "\":");
}

}  // namespace epinspect
