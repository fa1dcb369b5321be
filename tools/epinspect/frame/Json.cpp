#include "frame/Json.h"

#include "JsonText.h"
#include "frame/Output.h"

namespace epinspect {

using inspection::hexOf;
using inspection::isUTF8;
using inspection::jsonText;

namespace {

/// The members that hold a path: "NAME", and "NAMEHex" where it is not UTF-8.
std::string pathMembers(const std::string& name, const std::string& path) {
    std::string members = "\"" + name + "\":" + jsonText(path);
    if (isUTF8(path)) return members;
    return members.append(",\"").append(name).append("Hex\":\"").append(hexOf(path)).append("\"");
}

std::string lidMembers(const std::vector<std::uint32_t>& lids) {
    std::string members = "\"lid\":" + std::to_string(lids.front());
    if (lids.size() == 1) return members;
    const char* separator = ",\"lids\":[";
    for (const std::uint32_t lid : lids) {
        members += separator + std::to_string(lid);
        separator = ",";
    }
    return members + "]";
}

}  // namespace

Json::Json(const std::string& file, const std::vector<std::uint32_t>& lids)
    : file_(file.empty() ? R"("file":null)" : pathMembers("file", file)) {
    if (!lids.empty()) file_ += "," + lidMembers(lids);
}

Json& Json::begin(const char* kind) {
    if (kind != kind_) begin_ = std::string(R"({"kind":")") + kind + "\"," + file_;
    kind_ = kind;
    line_.clear();
    line_.add(begin_);
    inner_ = true;
    return *this;
}

void Json::end() {
    line_.add("}\n");
    print(line_.view());
}

Json& Json::lids(const std::vector<std::uint32_t>& lids) {
    if (!lids.empty()) ready(lidMembers(lids));
    return *this;
}

Json& Json::number(std::string_view name, std::uint64_t value) {
    anyKey(name);
    line_.decimal(value);
    return *this;
}

Json& Json::null(std::string_view name) {
    anyKey(name);
    line_.add("null");
    return *this;
}

Json& Json::hexadecimal(std::string_view name, std::uint64_t value) {
    anyKey(name);
    line_.add("\"").hexadecimal(value).add("\"");
    return *this;
}

Json& Json::text(std::string_view name, std::string_view value) {
    anyKey(name);
    line_.add(jsonText(value));
    return *this;
}

Json& Json::path(const std::string& name, const std::string& value) { return ready(pathMembers(name, value)); }

Json& Json::texts(std::string_view name, const std::vector<std::string>& values) {
    beginList(name);
    for (const std::string& value : values) {
        anyKey({});
        line_.add(jsonText(value));
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
