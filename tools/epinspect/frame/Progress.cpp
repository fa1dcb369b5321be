#include "frame/Progress.h"

#include <unistd.h>

#include <algorithm>
#include <cinttypes>
#include <cstdio>

#include "frame/Output.h"

namespace epinspect {

namespace {

constexpr auto period = std::chrono::seconds(1);

}  // namespace

Progress::Progress(const char* things, std::uint64_t total, Beside beside)
    : things_(things),
      total_(total),
      wanted_(isatty(STDERR_FILENO) == 1 && !(beside == Beside::listing && outputIsTerminal())),
      due_(start_ + period) {}

void Progress::show(std::uint64_t done) {
    if (!wanted_) return;
    const auto now = Clock::now();
    if (now < due_ || done == 0) return;
    due_ = now + period;
    const double share = static_cast<double>(done) / static_cast<double>(std::max(total_, done));
    const double seconds = std::chrono::duration<double>(now - start_).count();
    char line[160];
    const int length = std::snprintf(line, sizeof line, "%3.0f%%  %" PRIu64 " of %" PRIu64 " %s, %.0f s left",
                                     100 * share, done, total_, things_, seconds / share - seconds);
    if (length < 0) return;
    const auto columns = std::min<std::size_t>(
        {static_cast<std::size_t>(length), sizeof line - 1, terminalWidth(STDERR_FILENO) - std::size_t{1}});
    showStatusLine({line, columns});
}

}  // namespace epinspect
