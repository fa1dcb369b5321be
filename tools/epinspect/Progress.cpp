#include "Progress.h"

#include <unistd.h>

#include <cinttypes>
#include <cstdio>

namespace epinspect {

namespace {
constexpr auto period = std::chrono::seconds(1);
}

Progress::Progress(const char* what)
    : what_(what), terminal_(isatty(STDERR_FILENO) == 1), due_(std::chrono::steady_clock::now() + period) {}

Progress::~Progress() {
    if (shown_) static_cast<void>(std::fputs("\r\033[K", stderr));
}

void Progress::show(std::uint64_t done) {
    if (!terminal_ || std::chrono::steady_clock::now() < due_) return;
    static_cast<void>(std::fprintf(stderr, "\r%" PRIu64 " %s", done, what_));
    shown_ = true;
    due_ += period;
}

}  // namespace epinspect
