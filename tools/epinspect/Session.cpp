#include "Session.h"

#include <sys/stat.h>

#include <ISCSIEPFile.h>
#include <cerrno>
#include <cstdlib>
#include <filesystem>
#include <system_error>
#include <utility>

#include "CommandLine.h"
#include "Json.h"
#include "Output.h"

namespace epinspect {

namespace fs = std::filesystem;
namespace tool = ISCSI::TOOL;

namespace {

struct ErrorText {
    int error;
    const char* name;
    const char* text;
};

constexpr ErrorText errorTexts[] = {
    {tool::EP_ERR_BAD_ARGUMENT, "EP_ERR_BAD_ARGUMENT", "no input"},
    {tool::EP_ERR_OPEN_FAILED, "EP_ERR_OPEN_FAILED", "cannot be opened"},
    {tool::EP_ERR_READ_FAILED, "EP_ERR_READ_FAILED", "cannot be read"},
    {tool::EP_ERR_SEEK_FAILED, "EP_ERR_SEEK_FAILED", "position out of any file's range"},
    {tool::EP_ERR_BAD_UUID, "EP_ERR_BAD_UUID", "UUID cannot be shown"},
    {tool::EP_ERR_WRONG_FILE_TYPE, "EP_ERR_WRONG_FILE_TYPE", "wrong type of EP file"},
    {tool::EP_ERR_NO_PATH, "EP_ERR_NO_PATH", "path names no volume"},
    {tool::EP_ERR_BAD_EXTENT_SIZE, "EP_ERR_BAD_EXTENT_SIZE", "extent size cannot be used"},
};

constexpr const char* leadsOutText = "a link leads out of the folder of --root";

/// The row of a code of the library, null for one of the platform's library.
const ErrorText* find(int error) {
    for (const ErrorText& row : errorTexts) {
        if (row.error == error) return &row;
    }
    return nullptr;
}

std::string systemText(int reason) { return std::generic_category().message(reason); }

/// What failed, and why: `reason` is the errno value, 0 where the system is not to blame.
std::string whatFailed(int error, int reason) {
    const ErrorText* row = find(error);
    if (row == nullptr) {
        const std::string why = platformText(error);
        return "configuration cannot be loaded" + (why.empty() ? why : ": " + why);
    }
    if (reason != 0) return row->text + (": " + systemText(reason));
    return error == tool::EP_ERR_READ_FAILED ? "ends too early" : row->text;
}

std::string named(const Subject& subject) {
    if (subject.file.empty() && subject.part.empty()) return "''";
    return subject.file + (subject.file.empty() || subject.part.empty() ? "" : ": ") + subject.part;
}

}  // namespace

void Session::setRoot(const std::string& folder) {
    std::error_code error;
    if (!fs::is_directory(folder, error)) throw UsageError{error ? error.message() : "not a folder"};
    canonicalRoot_ = fs::canonical(folder, error).string();
    if (error) throw UsageError{error.message()};
    root_ = folder;
    while (!root_.empty() && root_.back() == '/') root_.pop_back();
    quiet_.emplace();
}

void Session::prepareLuns() {
    if (canonicalRoot_.empty() || std::exchange(lunsPrepared_, true)) return;
    std::string list = hostPath("/var/db/iscsi/luns.json");
    if (leadsOut(list)) {
        complain(list + ": not used: " + leadsOutText);
        list = "/dev/null";
    }
    // The stand-in for the platform's library reads that list; another choice in the environment wins.
    setenv("KELPISCSIEP_LUNS", list.c_str(), 0);
}

bool Session::exists(const std::string& path) const {
    std::error_code error;
    return fs::exists(hostPath(path), error) && !leadsOut(hostPath(path));
}

std::string Session::targetPath(const std::string& name) const {
    std::error_code error;
    const fs::path absolute = fs::absolute(name, error);
    if (error) return name;
    if (canonicalRoot_.empty()) return absolute.lexically_normal().string();
    // Below the root folder is what has it among the folders above, under whatever name.
    fs::path above;
    for (auto piece = absolute.begin(); piece != absolute.end(); ++piece) {
        above /= *piece;
        if (!fs::equivalent(above, canonicalRoot_, error)) continue;
        fs::path below = "/";
        while (++piece != absolute.end()) below /= *piece;
        return below.lexically_normal().string();
    }
    return (fs::path("/") / name).lexically_normal().string();
}

bool Session::leadsOut(const std::string& path) const {
    std::error_code error;
    const std::string canonical = fs::canonical(path, error).string();
    if (canonicalRoot_.empty() || canonicalRoot_ == "/" || error) return false;
    return canonical != canonicalRoot_ && canonical.compare(0, canonicalRoot_.size() + 1, canonicalRoot_ + "/") != 0;
}

std::optional<std::string> Session::openablePath(const std::string& name) {
    std::string path = canonicalRoot_.empty() ? name : hostPath(targetPath(name));
    struct stat status = {};
    const char* refusal = nullptr;
    if (leadsOut(path)) {
        refusal = leadsOutText;
    } else if (stat(path.c_str(), &status) == 0 && !S_ISREG(status.st_mode) && !S_ISBLK(status.st_mode)) {
        refusal = "neither a regular file nor a block device";
    }
    if (refusal == nullptr) return path;
    fail({name, ""}, std::string("cannot be opened: ") + refusal, tool::EP_ERR_OPEN_FAILED);
    return std::nullopt;
}

std::optional<std::string> Session::openableFolder(const std::string& path) {
    std::string folder = hostPath(path);
    if (!leadsOut(folder)) return folder;
    fail({path, ""}, "cannot be opened: a link leads out of the folder of --root", tool::EP_ERR_OPEN_FAILED);
    return std::nullopt;
}

bool Session::succeeded(int error, const Subject& subject) { return succeeded(error, subject, errno); }

bool Session::succeeded(int error, const Subject& subject, int reason) {
    if (error != 0) fail(subject, whatFailed(error, reason), error);
    return error == 0;
}

void Session::fail(const Subject& subject, std::string_view what, int error) {
    failed_ = true;
    const ErrorText* row = find(error);
    std::string message = named(subject) + ": ";
    message.append(what).append(" (").append(row != nullptr ? row->name + std::string(", ") : "code ");
    message.append(std::to_string(error)).append(")");
    if (json) {
        Json object(subject.file);
        object.begin("error");
        if (row != nullptr) {
            object.text("error", row->name);
        } else {
            object.null("error");
        }
        object.number("code", error).text("message", message).end();
    }
    complain(message);
}

void Session::failBeyondEnd(const std::string& file, const std::string& place, unsigned long long count) {
    std::string what = "beyond the end, the file holds ";
    if (count == 0) {
        what += "none";
    } else {
        what += count == 1 ? "0" : "0-" + std::to_string(count - 1);
    }
    fail({file, place}, what, tool::EP_ERR_READ_FAILED);
}

int Session::status() const {
    if (failed_) return 1;
    return differences ? 3 : 0;
}

}  // namespace epinspect
