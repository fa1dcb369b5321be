#include "store/Collection.h"

#include <ISCSIEPFile.h>
#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <cerrno>
#include <limits>
#include <nlohmann/json.hpp>
#include <set>

#include "JsonText.h"
#include "store/FileNames.h"
#include "store/FileSize.h"
#include "store/HostFile.h"

namespace inspection {

namespace {

using nlohmann::json;

constexpr std::uint64_t largestList = std::uint64_t{64} << 20U;  ///< bytes; a file takes about 100
constexpr auto positionLimit = static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max());

std::optional<std::string> bytesOf(const std::string& digits) {
    std::string bytes;
    for (std::size_t i = 0; i + 1 < digits.size(); i += 2) {
        const std::string pair = digits.substr(i, 2);
        if (pair.find_first_not_of("0123456789abcdef") != std::string::npos) return std::nullopt;
        bytes.push_back(static_cast<char>(std::stoi(pair, nullptr, 16)));
    }
    if (digits.size() % 2 != 0 || bytes.find('\0') != std::string::npos) return std::nullopt;
    return bytes;
}

/// The line of a file: its path's bytes too where it is not UTF-8.
std::string lineOf(const CollectedFile& file) {
    std::string line = R"({"path":)" + jsonText(file.path) + ",\"size\":" + std::to_string(file.size) +
                       ",\"taken\":" + std::to_string(file.taken) + ",\"changed\":" + (file.changed ? "true" : "false");
    if (!isUTF8(file.path)) line += R"(,"pathHex":")" + hexOf(file.path) + "\"";
    return line + "}";
}

/// The number `key` of `object`; nothing when it is none that a position in a file can be.
std::optional<std::uint64_t> numberIn(const json& object, const char* key) {
    const auto value = object.find(key);
    if (value == object.end() || !value->is_number_unsigned()) return std::nullopt;
    const auto number = value->get<std::uint64_t>();
    return number <= positionLimit ? std::optional(number) : std::nullopt;
}

std::optional<CollectedFile> fileIn(const json& object) {
    if (!object.is_object()) return std::nullopt;
    const auto size = numberIn(object, "size");
    const auto taken = numberIn(object, "taken");
    const bool hasHex = object.contains("pathHex");
    const auto text = object.find(hasHex ? "pathHex" : "path");
    const auto changed = object.find("changed");
    if (!size || !taken || *taken > *size || text == object.end() || !text->is_string()) return std::nullopt;
    if (changed == object.end() || !changed->is_boolean()) return std::nullopt;
    const auto path = hasHex ? bytesOf(text->get<std::string>()) : text->get<std::string>();
    if (!path || path->empty() || path->front() != '/' || path->find('\0') != std::string::npos) return std::nullopt;
    return CollectedFile{*path, *size, *taken, changed->get<bool>()};
}

/// The collection in a parsed document; nothing when it is damaged.
std::optional<Collection> collectionIn(const json& document) {
    Collection collection;
    if (!document.is_object()) return std::nullopt;
    const auto time = document.find("time");
    const auto program = document.find("program");
    const auto complete = document.find("complete");
    const auto files = document.find("files");
    for (const auto& member : {time, program, complete, files}) {
        if (member == document.end()) return std::nullopt;
    }
    if (!time->is_number_integer() || !program->is_string() || !complete->is_boolean() || !files->is_array()) {
        return std::nullopt;
    }
    collection.time = time->get<std::int64_t>();
    collection.program = program->get<std::string>();
    collection.complete = complete->get<bool>();
    for (const json& object : *files) {
        const auto file = fileIn(object);
        if (!file) return std::nullopt;
        collection.files.push_back(*file);
    }
    return collection;
}

Failure damaged(const std::string& list, const std::string& how) {
    return {{list, ""}, ISCSI::TOOL::EP_ERR_READ_FAILED, 0, "is damaged: " + how};
}

}  // namespace

std::variant<Collection, Failure> Collection::read(const std::string& folder, const std::string& list) {
    std::string text;
    const int error = readWhole(list, largestList, text);
    if (error == EFBIG) return damaged(list, "too large");
    if (error != 0) return Failure{{list, ""}, ISCSI::TOOL::EP_ERR_OPEN_FAILED, error, {}};
    const json document = json::parse(text, nullptr, false);
    if (document.is_discarded()) return damaged(list, "not JSON");
    auto collection = collectionIn(document);
    if (!collection) return damaged(list, "not a collection's list");
    const std::string damage = collection->damageIn(folder);
    if (!damage.empty()) return damaged(list, damage);
    return std::move(*collection);
}

/// Holds the list against the files that are there, and notes the sizes of those that were cut. Returns what does not
/// fit.
std::string Collection::damageIn(const std::string& folder) {
    std::set<std::string> paths;
    for (const CollectedFile& file : files) {
        if (!paths.insert(file.path).second) return file.path + " is listed twice";
        struct stat status = {};
        if (lstat((folder + file.path).c_str(), &status) != 0 || !S_ISREG(status.st_mode))
            continue;  // taken away since
        if (static_cast<std::uint64_t>(status.st_size) != file.taken) {
            return std::to_string(file.taken) + " bytes of " + file.path + " were taken, but the file has " +
                   std::to_string(status.st_size);
        }
        if (file.taken < file.size) sizes_[{status.st_dev, status.st_ino}] = file.size;
    }
    return {};
}

int Collection::write(const std::string& folder) const {
    std::string text = "{\n\"time\": " + std::to_string(time) + ", \"program\": " + jsonText(program) +
                       ", \"complete\": " + (complete ? "true" : "false") + ",\n\"files\": [";
    const char* separator = "\n";
    for (const CollectedFile& file : files) {
        text.append(separator).append(lineOf(file));
        separator = ",\n";
    }
    text += "\n]}\n";
    return writeWhole(pathIn(folder, listName), text);
}

std::optional<std::uint64_t> Collection::sizeOf(const std::string& hostPath) const {
    struct stat status = {};
    if (sizes_.empty() || stat(hostPath.c_str(), &status) != 0) return std::nullopt;
    const auto size = sizes_.find({status.st_dev, status.st_ino});
    return size == sizes_.end() ? std::nullopt : std::optional(size->second);
}

}  // namespace inspection
