// The library's log lines on their way to the system log.
#pragma once

#include <string>
#include <vector>

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

/// While one lives, log lines are held back: they are not shown either. One at a time.
class HeldLog {
public:
    HeldLog();
    ~HeldLog();
    HeldLog(const HeldLog&) = delete;
    HeldLog& operator=(const HeldLog&) = delete;

private:
    QuietLog quiet_;
};

/// The lines held back since the last call, if log lines are shown. Lines that nobody takes are never shown.
std::vector<std::string> takeHeldLines();

}  // namespace epinspect
