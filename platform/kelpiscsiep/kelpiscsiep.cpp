// Stand-in for the platform's iSCSI management library: answers from a list of LUNs in a JSON file, so that the EP
// tools can be built and tried where that library is not at hand. The list is gone through as a stream, once after each
// change of the file. What is kept of it is where each LUN starts, 16 bytes per LUN and at most 16 MiB.
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
#include <ctime>
#include <istream>
#include <mutex>
#include <nlohmann/json.hpp>
#include <optional>
#include <streambuf>
#include <string>
#include <system_error>
#include <type_traits>
#include <utility>
#include <vector>

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

/// What shows that a file was changed or replaced.
struct FileState {
    dev_t device;
    ino_t inode;
    off_t size;
    timespec modified, changed;

    bool operator==(const FileState& other) const {
        const auto same = [](const timespec& a, const timespec& b) {
            return a.tv_sec == b.tv_sec && a.tv_nsec == b.tv_nsec;
        };
        return device == other.device && inode == other.inode && size == other.size && same(modified, other.modified) &&
               same(changed, other.changed);
    }

    /// Whether any change from now on will show. One that follows the last at once may have the same time.
    bool willShowChanges() const {
        constexpr time_t coarsestClock = 2;  // seconds, of all file systems
        return std::time(nullptr) - changed.tv_sec > coarsestClock;
    }
};

/// Calls a function of the system again for as long as it is interrupted.
template <typename Call>
auto uninterrupted(Call call) {
    auto result = call();
    while (result < 0 && errno == EINTR) result = call();
    return result;
}

/// The bytes of a file, a block at a time. A read that fails throws.
class FileBytes : public std::streambuf {
public:
    explicit FileBytes(const char* path)
        : descriptor_(uninterrupted([path] { return open(path, O_RDONLY | O_CLOEXEC | O_NONBLOCK); })) {}
    FileBytes(const FileBytes&) = delete;
    FileBytes& operator=(const FileBytes&) = delete;
    ~FileBytes() override {
        if (descriptor_ >= 0) close(descriptor_);
    }

    /// Nothing unless it is a regular file.
    std::optional<FileState> state() const {
        struct stat status = {};
        if (descriptor_ < 0 || fstat(descriptor_, &status) != 0 || !S_ISREG(status.st_mode)) return std::nullopt;
        return FileState{status.st_dev, status.st_ino, status.st_size, status.st_mtim, status.st_ctim};
    }

    /// Where in the file the next byte lies.
    std::uint64_t position() const { return blockStart_ + static_cast<std::uint64_t>(gptr() - eback()); }

    void goTo(std::uint64_t position) {
        if (lseek(descriptor_, static_cast<off_t>(position), SEEK_SET) < 0) fail();
        blockStart_ = position;
        setg(nullptr, nullptr, nullptr);
    }

protected:
    int_type underflow() override {
        blockStart_ = position();
        const ssize_t count = uninterrupted([this] { return read(descriptor_, block_.data(), block_.size()); });
        if (count < 0) fail();
        setg(block_.data(), block_.data(), block_.data() + count);
        return count > 0 ? traits_type::to_int_type(block_[0]) : traits_type::eof();
    }

private:
    [[noreturn]] static void fail() { throw std::system_error(errno, std::generic_category()); }

    const int descriptor_;
    std::uint64_t blockStart_ = 0;
    std::array<char, 16384> block_;
};

/// Where a LUN of the list starts, in bytes from the start of the file.
struct LunStart {
    std::uint32_t lid;
    std::uint64_t position;
};

constexpr std::size_t mostLuns = 1U << 20U;  ///< whose starts are kept

/// Picks a LUN from the list, or from one part of it, and notes where the LUNs start. Its operations have the names
/// that the JSON parser calls for each piece it meets. Where they return false the list is malformed.
class LunFinder {
public:
    enum class Part { list, lun };

    LunFinder(const FileBytes& bytes, std::uint32_t lid, Part part)
        : bytes_(bytes), lid_(lid), depth_(part == Part::list ? 0 : inList) {}

    /// Whether the LUN was there; the first of several counts.
    bool found() const { return found_.has_value(); }

    /// Puts the LUN, if it was there, into the record.
    Result fillRecord(void* record) const {
        if (!found_->isComplete()) return BAD_VALUE;
        fill(record, *found_);
        return OK;
    }

    /// The result for an id that was not there, after the whole list.
    Result otherwise() const { return ended_ ? BAD_VALUE : NO_SUCH_LUN; }

    /// Where the LUNs start, of no more than mostLuns.
    std::vector<LunStart>& starts() { return starts_; }

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
        if (startsLun) {
            lun_ = Lun();
            start_ = bytes_.position() - 1;  // the brace has been read
        }
        const bool proper = startsLun || take(OtherValue());
        ++depth_;
        return proper;
    }

    bool key(const std::string& name) {
        key_ = keyOf(name);
        return true;
    }

    bool end_object() {
        if (--depth_ == inList && !ended_) finishLun();
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
        if (depth_ == inList) ended_ = true;
        if (depth_ == inLun) takeField(value);
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
            ended_ = true;
            return;
        }
        if (starts_.size() < mostLuns) starts_.push_back({*lun_.lid, start_});
        if (*lun_.lid == lid_ && !found_) found_ = lun_;
    }

    const FileBytes& bytes_;
    const std::uint32_t lid_;
    std::uint64_t depth_;
    std::uint64_t start_ = 0;
    Key key_ = Key::other;
    Lun lun_;
    std::optional<Lun> found_;
    bool ended_ = false;  ///< there was a part that is no LUN, or a LUN without an id: what follows does not count
    std::vector<LunStart> starts_;
};

/// What is known of the list that was read last.
struct KnownList {
    std::optional<FileState> file;  ///< nothing: no list is known
    std::vector<LunStart> luns;     ///< by id, each id once
    Result otherwise = OK;          ///< for any other id
};

/// Answers from what is known of the list. Nothing where another LUN stands at the known place after all.
std::optional<Result> lookUp(const KnownList& known, FileBytes& bytes, std::uint32_t lid, void* record) {
    const auto lun = std::lower_bound(known.luns.begin(), known.luns.end(), lid,
                                      [](const LunStart& start, std::uint32_t id) { return start.lid < id; });
    if (lun == known.luns.end() || lun->lid != lid) return known.otherwise;
    bytes.goTo(lun->position);
    std::istream text(&bytes);
    LunFinder finder(bytes, lid, LunFinder::Part::lun);
    const bool whole = nlohmann::json::sax_parse(text, &finder, nlohmann::json::input_format_t::json, false);
    if (!whole || !finder.found()) return std::nullopt;
    return finder.fillRecord(record);
}

/// What lookUp() needs. Of several LUNs with one id the first in the list counts.
std::vector<LunStart> orderedById(std::vector<LunStart> luns) {
    std::sort(luns.begin(), luns.end(), [](const LunStart& a, const LunStart& b) {
        return a.lid != b.lid ? a.lid < b.lid : a.position < b.position;
    });
    const auto sameId = [](const LunStart& a, const LunStart& b) { return a.lid == b.lid; };
    luns.erase(std::unique(luns.begin(), luns.end(), sameId), luns.end());
    luns.shrink_to_fit();
    return luns;
}

/// Answers from the whole list, which is known from then on if a later change of the file will show.
Result goThrough(KnownList& known, FileBytes& bytes, const FileState& file, std::uint32_t lid, void* record) {
    known = KnownList();
    const bool willShowChanges = file.willShowChanges();
    bytes.goTo(0);
    std::istream list(&bytes);
    LunFinder finder(bytes, lid, LunFinder::Part::list);
    const bool isList = nlohmann::json::sax_parse(list, &finder);
    const Result otherwise = isList ? finder.otherwise() : LIST_MALFORMED;
    if (willShowChanges && finder.starts().size() < mostLuns) {
        if (isList) known.luns = orderedById(std::move(finder.starts()));
        known.otherwise = otherwise;
        known.file = file;
    }
    return isList && finder.found() ? finder.fillRecord(record) : otherwise;
}

/// Where the list lies.
const char* listPath() {
    const char* path = std::getenv("KELPISCSIEP_LUNS");  // NOLINT(concurrency-mt-unsafe): nothing here sets it
    return path != nullptr ? path : "/var/db/iscsi/luns.json";
}

Result findLun(std::uint32_t lid, void* record) {
    static std::mutex mutex;
    static KnownList& known = *new KnownList;  // never destroyed: threads may call for as long as the program runs
    const std::lock_guard<std::mutex> lock(mutex);
    FileBytes bytes(listPath());
    const std::optional<FileState> file = bytes.state();
    if (!file) return LIST_UNREADABLE;
    if (known.file == file) {
        const std::optional<Result> result = lookUp(known, bytes, lid, record);
        if (result) return *result;
    }
    return goThrough(known, bytes, *file, lid, record);
}

/// Sets errno to the reason why the list cannot be used, and to 0 where it can be: that is how a list without the LUN
/// is told from a list of no use.
void setReason(Result result) {
    if (result == LIST_MALFORMED || result == BAD_VALUE) {
        errno = EBADMSG;
    } else if (result != LIST_UNREADABLE) {
        errno = 0;
    } else if (errno == 0) {  // no call has failed: it is no regular file
        errno = EINVAL;
    }
}

/// "The LUN list /var/db/iscsi/luns.json" and `what` is wrong with it. Stays as it is until the thread asks again.
const char* aboutList(const char* what) {
    static thread_local std::string text;
    try {
        text = std::string("The LUN list ") + listPath() + " " + what;
        return text.c_str();
    } catch (...) {
        return "There is no memory for a text";
    }
}

}  // namespace

extern "C" {

__attribute__((visibility("default"))) int KELPiSCSILunGetByLid(unsigned int lid, int /*reserved*/, void* record) {
    try {
        const Result result = findLun(lid, record);
        setReason(result);
        return result;
    } catch (const std::system_error& error) {  // the list cannot be read to its end
        errno = error.code().value();
    } catch (...) {
        errno = ENOMEM;
    }
    return LIST_UNREADABLE;
}

__attribute__((visibility("default"))) const char* KELPiSCSIStrError(int code) {
    switch (code) {
        case OK:
            return "Success";
        case NO_SUCH_LUN:
            return "No such LUN";
        case LIST_UNREADABLE:
            return aboutList("is missing or cannot be read");
        case LIST_MALFORMED:
            return aboutList("is not a JSON array");
        case BAD_VALUE:
            return aboutList("holds a value of the wrong type, or one that does not fit its field");
        default:
            return "Unknown error";
    }
}

}  // extern "C"
