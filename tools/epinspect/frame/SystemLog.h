// The library's log lines on their way to the system log.
#pragma once

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

}  // namespace epinspect
