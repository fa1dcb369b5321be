// The library calls syslog(), and gets the one defined here. openlog() with LOG_PERROR would show the lines too, but
// not escaped for a terminal, and could not keep them off the system log. In a static program the function has another
// name (see CMakeLists.txt).
#include "frame/SystemLog.h"

#include <syslog.h>

#include <cstdarg>
#include <cstdio>
#include <string>
#include <utility>
#include <vector>

#include "frame/Output.h"

namespace {

bool shown = false;
unsigned int quiet = 0;
bool holding = false;
std::vector<std::string> held;

constexpr std::size_t lineSize = 9216;  // the longest line holds a LUN record's texts

/// Shows the line or holds it back. Throws nothing: the caller is the library, which does not expect it.
void take(const char* line) noexcept {
    try {
        if (holding) {
            held.emplace_back(line);
        } else {
            epinspect::complain(line);
        }
    } catch (...) {
        epinspect::complainPlainly({"out of memory for a log line"});
    }
}

}  // namespace

namespace epinspect {

void showLogLines() { shown = true; }

QuietLog::QuietLog() { ++quiet; }
QuietLog::~QuietLog() { --quiet; }

HeldLog::HeldLog() { holding = true; }

HeldLog::~HeldLog() {
    holding = false;
    held.clear();
}

std::vector<std::string> takeHeldLines() { return std::exchange(held, {}); }

}  // namespace epinspect

extern "C" __attribute__((visibility("default"), format(printf, 2, 3))) void syslog(int priority, const char* format,
                                                                                    ...) {
    char line[lineSize];
    va_list arguments;
    va_start(arguments, format);
    std::vsnprintf(line, sizeof line, format, arguments);
    va_end(arguments);
    if (shown) take(line);
    if (quiet > 0) return;
    va_start(arguments, format);
    vsyslog(priority, format, arguments);
    va_end(arguments);
}
