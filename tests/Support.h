// What the tests share: log lines as they reach syslog(). Included once per test program.
#pragma once

#include <gtest/gtest.h>

#include <cerrno>
#include <cstdarg>
#include <cstdio>
#include <fstream>
#include <string>
#include <vector>

#include "TempDir.h"

using Lines = std::vector<std::string>;

inline Lines logLines, logFormats;
inline bool logging = false;  ///< syslog() is at work: a test that makes memory scarce spares it

/// syslog() itself, whatever a hardened build makes of that name: keeps what the library writes to the system log. A
/// line that was not at LOG_ERR says so. Disturbs errno, as the real one may.
void keepLogLine(int priority, const char* format, ...) __asm__("syslog");
__attribute__((visibility("default"), format(printf, 2, 3))) void keepLogLine(int priority, const char* format, ...) {
    char text[8192];
    va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(text, sizeof text, format, arguments);
    va_end(arguments);
    logging = true;
    logFormats.emplace_back(format);
    logLines.push_back(priority == 3 ? text : "not LOG_ERR: " + std::string(text));
    logging = false;
    errno = EDOM;
}

/// The lines logged since the last call.
inline Lines takeLog() { return std::exchange(logLines, {}); }

/// "iSCSI:SOURCE path: PATH" for each source, as a failure chain about one path leaves them.
inline Lines chain(const std::string& path, Lines sources) {
    for (std::string& source : sources) source = "iSCSI:" + source + " path: " + path;
    return sources;
}
