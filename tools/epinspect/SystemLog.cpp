// The library's log lines go to the system log through the syslog() defined here, and on request to standard error.
#include <syslog.h>

#include <cstdarg>
#include <cstdio>
#include <string>

#include "Output.h"
#include "Session.h"

namespace {

bool shown = false;

__attribute__((format(printf, 1, 0))) std::string formatted(const char* format, va_list arguments) {
    va_list again;
    va_copy(again, arguments);
    const int length = std::vsnprintf(nullptr, 0, format, arguments);
    std::string text(length > 0 ? static_cast<std::string::size_type>(length) : 0, '\0');
    std::vsnprintf(text.data(), text.size() + 1, format, again);
    va_end(again);
    return text;
}

}  // namespace

void epinspect::showLogLines() { shown = true; }

extern "C" __attribute__((visibility("default"), format(printf, 2, 3))) void syslog(int priority, const char* format,
                                                                                    ...) {
    va_list arguments;
    va_start(arguments, format);
    const std::string line = formatted(format, arguments);
    va_end(arguments);
    if (shown) epinspect::complain(line);
    va_start(arguments, format);
    vsyslog(priority, format, arguments);
    va_end(arguments);
}
