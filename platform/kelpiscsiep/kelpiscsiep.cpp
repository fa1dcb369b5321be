// Stand-in for the platform's iSCSI management library: answers from a list of LUNs in a JSON file, so that the EP
// tools can be built and tried where that library is not at hand. The list is read anew at each call.
#include "kelpiscsiep.h"

#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <limits>
#include <nlohmann/json.hpp>
#include <string>

namespace {

enum Result { OK = 0, NO_SUCH_LUN = 9001, LIST_UNREADABLE = 9002, LIST_MALFORMED = 9003, BAD_VALUE = 9004 };

/// A value of the list that does not have its field's type or does not fit its field.
struct BadValue {};

constexpr std::size_t recordSize = KELPISCSI_LUN_RECORD_SIZE;

std::string listPath() {
    const char* path = std::getenv("KELPISCSIEP_LUNS");  // NOLINT(concurrency-mt-unsafe): nothing here sets it
    return path != nullptr ? path : "/var/db/iscsi/luns.json";
}

template <typename Number>
Number number(const nlohmann::json& lun, const char* key) {
    const auto value = lun.find(key);
    if (value == lun.end() || !value->is_number_integer()) throw BadValue();
    if (value->is_number_unsigned()) {
        const auto stored = value->get<std::uint64_t>();
        if (stored > static_cast<std::uint64_t>(std::numeric_limits<Number>::max())) throw BadValue();
        return static_cast<Number>(stored);
    }
    const auto stored = value->get<std::int64_t>();  // below 0
    if (!std::numeric_limits<Number>::is_signed ||
        stored < static_cast<std::int64_t>(std::numeric_limits<Number>::min())) {
        throw BadValue();
    }
    return static_cast<Number>(stored);
}

/// The record as it is built; each field lies between its offset and the next field's.
class Record {
public:
    template <typename Number>
    void putNumber(std::size_t offset, const nlohmann::json& lun, const char* key) {
        const auto value = number<Number>(lun, key);
        std::memcpy(bytes_ + offset, &value, sizeof value);
    }

    void putText(std::size_t offset, std::size_t end, const nlohmann::json& lun, const char* key) {
        const auto value = lun.find(key);
        if (value == lun.end() || !value->is_string()) throw BadValue();
        const auto& text = value->get_ref<const std::string&>();
        if (text.size() >= end - offset || text.find('\0') != std::string::npos) throw BadValue();
        std::memcpy(bytes_ + offset, text.data(), text.size());
    }

    void copyTo(void* record) const { std::memcpy(record, bytes_, recordSize); }

private:
    unsigned char bytes_[recordSize] = {};
};

Record recordOf(const nlohmann::json& lun) {
    Record record;
    record.putNumber<std::uint32_t>(20, lun, "extentSize");
    record.putNumber<std::uint64_t>(24, lun, "size");
    record.putNumber<std::int32_t>(32, lun, "restoreTime");
    record.putNumber<std::int32_t>(36, lun, "type");
    record.putText(44, 118, lun, "uuid");
    record.putText(118, 4213, lun, "rootPath");
    record.putText(4213, recordSize, lun, "name");
    return record;
}

Result findLun(unsigned int lid, void* record) {
    const std::string path = listPath();
    std::error_code error;
    if (!std::filesystem::is_regular_file(path, error)) return LIST_UNREADABLE;
    std::ifstream file(path, std::ios::binary);
    if (!file) return LIST_UNREADABLE;
    const auto list = nlohmann::json::parse(file, nullptr, false);
    if (!list.is_array()) return LIST_MALFORMED;
    for (const auto& lun : list) {
        if (!lun.is_object()) return BAD_VALUE;
        if (number<std::uint32_t>(lun, "lid") != lid) continue;
        recordOf(lun).copyTo(record);
        return OK;
    }
    return NO_SUCH_LUN;
}

}  // namespace

extern "C" {

__attribute__((visibility("default"))) int KELPiSCSILunGetByLid(unsigned int lid, int /*reserved*/, void* record) {
    try {
        return findLun(lid, record);
    } catch (const BadValue&) {
        return BAD_VALUE;
    } catch (...) {
        return LIST_UNREADABLE;
    }
}

__attribute__((visibility("default"))) const char* KELPiSCSIStrError(int code) {
    switch (code) {
        case OK:
            return "Success";
        case NO_SUCH_LUN:
            return "No such LUN";
        case LIST_UNREADABLE:
            return "The LUN list is missing or cannot be read";
        case LIST_MALFORMED:
            return "The LUN list is not a JSON array";
        case BAD_VALUE:
            return "The LUN list holds a value of the wrong type, or one that does not fit its field";
        default:
            return "Unknown error";
    }
}

}  // extern "C"
