#include "frame/StatusLine.h"

#include <unistd.h>

#include <cerrno>
#include <csignal>
#include <utility>

#include "frame/Interruption.h"

namespace epinspect {

namespace {

constexpr int endingSignals[] = {SIGINT, SIGTERM, SIGHUP, SIGQUIT};

volatile std::sig_atomic_t shown = 0;

extern "C" void endBySignal(int signal) {
    eraseStatusLine();
    static_cast<void>(std::raise(signal));  // arrives, with its default action, when this handler returns
}

/// From now on the signals that end the program erase the line first.
void watchSignals() {
    for (const int signal : endingSignals) {
        struct sigaction action = {};
        if (sigaction(signal, nullptr, &action) != 0 || action.sa_handler != SIG_DFL) continue;
        action.sa_handler = endBySignal;
        action.sa_flags = static_cast<int>(SA_RESETHAND);
        sigaction(signal, &action, nullptr);
    }
}

}  // namespace

void showStatusLine(std::string_view text) {
    static bool watched = false;
    if (!std::exchange(watched, true)) watchSignals();
    eraseStatusLine();
    shown = 1;
    writeAll(STDERR_FILENO, text);
}

void eraseStatusLine() noexcept {
    if (shown == 0) return;
    shown = 0;
    writeAll(STDERR_FILENO, "\r\033[K");
}

int writeAll(int stream, std::string_view text) noexcept {
    while (!text.empty()) {
        const ssize_t written = write(stream, text.data(), text.size());
        if (written < 0 && errno == EINTR && !isInterrupted()) continue;
        if (written < 0) return errno;
        text.remove_prefix(static_cast<std::size_t>(written));
        if (!text.empty() && isInterrupted()) return EINTR;
    }
    return 0;
}

}  // namespace epinspect
