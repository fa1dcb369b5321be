// The library's log lines on their way to the system log.
#pragma once

#include <string>

namespace epinspect {

/// From now on the log lines are shown on standard error too.
void showLogLines();

/// While one lives, log lines do not go to the system log.
class QuietLog {
public:
    QuietLog();
    ~QuietLog();
    QuietLog(const QuietLog&) = delete;
    QuietLog& operator=(const QuietLog&) = delete;
};

/// The platform library's text for its error `code`, taken from the line that the failed lookup of a LUN logged last;
/// empty when that line was about something else.
std::string platformText(int code);

}  // namespace epinspect
