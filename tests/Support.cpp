#include "Support.h"

#include <syslog.h>

#include <cstdarg>
#include <cstdlib>
#include <filesystem>
#include <mutex>

namespace {
std::vector<std::string> lines;
std::mutex linesMutex;
}  // namespace

extern "C" __attribute__((visibility("default"))) void syslog(int priority, const char* format, ...) {
    char text[8192];
    va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    const std::lock_guard lock(linesMutex);
    try {
        lines.push_back(priority == LOG_ERR ? text : "not LOG_ERR: " + std::string(text));
    } catch (const std::bad_alloc&) {  // a test has made memory scarce: the line is lost
    }
}

std::vector<std::string> takeLog() {
    const std::lock_guard lock(linesMutex);
    return std::exchange(lines, {});
}

std::vector<std::string> chain(const std::string& path, const std::vector<std::string>& sources) {
    std::vector<std::string> result;
    for (const std::string& source : sources)
        result.push_back("iSCSI:" + source + " path: " + path);
    return result;
}

TempDir::TempDir() {
    std::string name = (std::filesystem::temp_directory_path() / "eptestXXXXXX").string();
    path_ = mkdtemp(name.data());
}

TempDir::~TempDir() {
    std::error_code error;
    std::filesystem::remove_all(path_, error);
}
