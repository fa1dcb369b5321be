// Stand-in for the platform's iSCSI management library: answers from a list of LUNs in a JSON file, so that the EP
// tools can be built and tried where that library is not at hand. The list is read anew at each call, as a stream: of
// a list of any length no more than one LUN is held.
#include "kelpiscsiep.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdint>
#include <cstdlib>
#include <cstring>
#include <istream>
#include <nlohmann/json.hpp>
#include <optional>
#include <streambuf>
#include <string>
#include <system_error>
#include <type_traits>

namespace {

enum Result { OK = 0, NO_SUCH_LUN = 9001, LIST_UNREADABLE = 9002, LIST_MALFORMED = 9003, BAD_VALUE = 9004 };

/// Where a text of the record lies, its NUL included.
struct TextPlace {
    std::size_t begin, end;
};

constexpr TextPlace uuidPlace = {KELPISCSI_LUN_UUID, KELPISCSI_LUN_ROOT_PATH};
constexpr TextPlace rootPathPlace = {KELPISCSI_LUN_ROOT_PATH, KELPISCSI_LUN_NAME};
constexpr TextPlace namePlace = {KELPISCSI_LUN_NAME, KELPISCSI_LUN_RECORD_SIZE};

/// A LUN of the list. What is missing there, has the wrong type or does not fit its field is empty.
struct Lun {
    std::optional<std::uint32_t> lid, extentSize;
    std::optional<std::uint64_t> size;
    std::optional<std::int32_t> restoreTime, type;
    std::optional<std::string> uuid, rootPath, name;

    bool isComplete() const { return extentSize && size && restoreTime && type && uuid && rootPath && name; }
};

void fill(void* record, const Lun& lun) {
    auto* const bytes = static_cast<unsigned char*>(record);
    const auto putNumber = [bytes](std::size_t offset, auto value) {
        std::memcpy(bytes + offset, &value, sizeof value);
    };
    const auto putText = [bytes](TextPlace place, const std::string& text) {
        std::copy(text.begin(), text.end(), bytes + place.begin);
    };
    std::memset(bytes, 0, KELPISCSI_LUN_RECORD_SIZE);
    putNumber(KELPISCSI_LUN_EXTENT_SIZE, *lun.extentSize);
    putNumber(KELPISCSI_LUN_SIZE, *lun.size);
    putNumber(KELPISCSI_LUN_RESTORE_TIME, *lun.restoreTime);
    putNumber(KELPISCSI_LUN_TYPE, *lun.type);
    putText(uuidPlace, *lun.uuid);
    putText(rootPathPlace, *lun.rootPath);
    putText(namePlace, *lun.name);
}

/// A value that is neither an integer nor a text.
struct OtherValue {};

template <typename Number, typename Value>
void assign(std::optional<Number>& field, const Value& value) {
    field.reset();
    if constexpr (std::is_integral_v<Value>) {
        const auto number = static_cast<Number>(value);
        if (static_cast<Value>(number) == value && (number < 0) == (value < 0)) field = number;
    }
}

template <typename Value>
void assign(std::optional<std::string>& field, const Value& value, TextPlace place) {
    field.reset();
    if constexpr (std::is_same_v<Value, std::string>) {
        if (value.size() < place.end - place.begin && value.find('\0') == std::string::npos) field = value;
    }
}

enum class Key { other, lid, extentSize, size, restoreTime, type, uuid, rootPath, name };

Key keyOf(const std::string& text) {
    static constexpr const char* names[] = {"lid",  "extentSize", "size",     "restoreTime",
                                            "type", "uuid",       "rootPath", "name"};
    int key = static_cast<int>(Key::other);
    for (const char* name : names) {
        ++key;
        if (text == name) return static_cast<Key>(key);
    }
    return Key::other;
}

/// Finds one LUN in the list, which the JSON parser tells it piece by piece; its operations have the names that the
/// parser calls. Where they return false the list is malformed.
class LunFinder {
public:
    explicit LunFinder(std::uint32_t lid) : lid_(lid) {}

    /// What the whole list, which must have been read, says of the LUN.
    Result result() const { return result_.value_or(NO_SUCH_LUN); }

    /// The LUN, if the result is OK.
    const Lun& lun() const { return lun_; }

    bool null() { return take(OtherValue()); }
    bool boolean(bool /*value*/) { return take(OtherValue()); }
    bool number_integer(std::int64_t value) { return take(value); }
    bool number_unsigned(std::uint64_t value) { return take(value); }
    bool number_float(double /*value*/, const std::string& /*text*/) { return take(OtherValue()); }
    bool string(const std::string& value) { return take(value); }
    bool binary(const nlohmann::json::binary_t& /*value*/) { return take(OtherValue()); }

    bool start_array(std::size_t /*size*/) {
        take(OtherValue());
        ++depth_;
        return true;
    }

    bool end_array() {
        --depth_;
        return true;
    }

    bool start_object(std::size_t /*size*/) {
        const bool startsLun = depth_ == inList;
        if (startsLun && !result_) lun_ = Lun();
        const bool proper = startsLun || take(OtherValue());
        ++depth_;
        return proper;
    }

    bool key(const std::string& name) {
        key_ = keyOf(name);
        return true;
    }

    bool end_object() {
        if (--depth_ == inList && !result_) finishLun();
        return true;
    }

    bool parse_error(std::size_t /*position*/, const std::string& /*token*/, const std::exception& /*error*/) {
        return false;
    }

private:
    static constexpr std::uint64_t inList = 1, inLun = 2;

    /// A value, or the start of one of several parts. Of a key that is repeated the last value counts.
    template <typename Value>
    bool take(const Value& value) {
        if (depth_ == inList && !result_) result_ = BAD_VALUE;
        if (depth_ == inLun && !result_) takeField(value);
        return depth_ > 0;
    }

    template <typename Value>
    void takeField(const Value& value) {
        switch (key_) {
            case Key::lid:
                return assign(lun_.lid, value);
            case Key::extentSize:
                return assign(lun_.extentSize, value);
            case Key::size:
                return assign(lun_.size, value);
            case Key::restoreTime:
                return assign(lun_.restoreTime, value);
            case Key::type:
                return assign(lun_.type, value);
            case Key::uuid:
                return assign(lun_.uuid, value, uuidPlace);
            case Key::rootPath:
                return assign(lun_.rootPath, value, rootPathPlace);
            case Key::name:
                return assign(lun_.name, value, namePlace);
            case Key::other:
                return;
        }
    }

    void finishLun() {
        if (!lun_.lid) {
            result_ = BAD_VALUE;
        } else if (*lun_.lid == lid_) {
            result_ = lun_.isComplete() ? OK : BAD_VALUE;
        }
    }

    const std::uint32_t lid_;
    std::uint64_t depth_ = 0;
    Key key_ = Key::other;
    Lun lun_;
    std::optional<Result> result_;
};

/// The bytes of a file, a block at a time. A read that fails throws.
class FileBytes : public std::streambuf {
public:
    explicit FileBytes(const char* path) : descriptor_(open(path, O_RDONLY | O_CLOEXEC | O_NONBLOCK)) {}
    FileBytes(const FileBytes&) = delete;
    FileBytes& operator=(const FileBytes&) = delete;
    ~FileBytes() override {
        if (descriptor_ >= 0) close(descriptor_);
    }

    bool isRegularFile() const {
        struct stat status = {};
        return descriptor_ >= 0 && fstat(descriptor_, &status) == 0 && S_ISREG(status.st_mode);
    }

protected:
    int_type underflow() override {
        const ssize_t count = read(descriptor_, block_.data(), block_.size());
        if (count < 0) throw std::system_error(errno, std::generic_category());
        setg(block_.data(), block_.data(), block_.data() + count);
        return count > 0 ? traits_type::to_int_type(block_[0]) : traits_type::eof();
    }

private:
    const int descriptor_;
    std::array<char, 16384> block_;
};

Result findLun(std::uint32_t lid, void* record) {
    const char* path = std::getenv("KELPISCSIEP_LUNS");  // NOLINT(concurrency-mt-unsafe): nothing here sets it
    FileBytes bytes(path != nullptr ? path : "/var/db/iscsi/luns.json");
    if (!bytes.isRegularFile()) return LIST_UNREADABLE;
    std::istream list(&bytes);
    LunFinder finder(lid);
    if (!nlohmann::json::sax_parse(list, &finder)) return LIST_MALFORMED;
    if (finder.result() == OK) fill(record, finder.lun());
    return finder.result();
}

}  // namespace

extern "C" {

__attribute__((visibility("default"))) int KELPiSCSILunGetByLid(unsigned int lid, int /*reserved*/, void* record) {
    try {
        return findLun(lid, record);
    } catch (...) {  // no memory, or the list cannot be read to its end
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
