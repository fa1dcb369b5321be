// The library calls syslog(); the one defined here takes that call. openlog() with LOG_PERROR would show the lines too,
// but not escaped for a terminal, could not keep them off the system log, and would not let the platform library's
// text be had.
#include "SystemLog.h"

#include <syslog.h>

#include <cstdarg>
#include <cstdio>
#include <cstring>
#include <string_view>

#include "Output.h"

namespace {

bool shown = false;
unsigned int quiet = 0;

constexpr std::size_t lineSize = 9216;  // the longest line holds a LUN record's texts
constexpr std::string_view errorMark = ". error: ";
char errorLine[lineSize];  ///< the last line about an error of the platform's library

/// Throws nothing: the caller is the library, which does not expect it.
void keep(const char* line) noexcept {
    if (std::strstr(line, errorMark.data()) != nullptr) std::memcpy(errorLine, line, std::strlen(line) + 1);
    if (!shown) return;
    try {
        epinspect::complain(line);
    } catch (...) {
        epinspect::complainPlainly({"out of memory for a log line"});
    }
}

}  // namespace

namespace epinspect {

void showLogLines() { shown = true; }

QuietLog::QuietLog() { ++quiet; }
QuietLog::~QuietLog() { --quiet; }

std::string platformText(int code) {
    const std::string_view line = errorLine;
    const std::string mark = std::string(errorMark) + std::to_string(code) + " (";
    const auto start = line.rfind(mark);
    if (start == std::string_view::npos || line.back() != ')') return {};
    const auto text = line.substr(start + mark.size());
    return std::string(text.substr(0, text.size() - 1));
}

}  // namespace epinspect

extern "C" __attribute__((visibility("default"), format(printf, 2, 3))) void syslog(int priority, const char* format,
                                                                                    ...) {
    char line[lineSize];
    va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(line, sizeof line, format, arguments);
    va_end(arguments);
    keep(line);
    if (quiet > 0) return;
    va_start(arguments, format);
    vsyslog(priority, format, arguments);
    va_end(arguments);
}
