#include "frame/Interruption.h"

#include <csignal>
#include <initializer_list>

namespace epinspect {

namespace {

volatile std::sig_atomic_t arrived = 0;

extern "C" void remember(int signal) { arrived = signal; }

}  // namespace

void holdInterruptions() {
    for (const int signal : {SIGINT, SIGTERM, SIGHUP}) {
        struct sigaction action = {};
        if (sigaction(signal, nullptr, &action) != 0 || action.sa_handler == SIG_IGN) continue;
        action = {};
        action.sa_handler = remember;
        action.sa_flags = static_cast<int>(SA_RESETHAND);  // and not SA_RESTART: a write that waits comes back
        sigaction(signal, &action, nullptr);
    }
}

int interruption() noexcept { return arrived; }

void checkInterruption() {
    if (arrived != 0) throw Interrupted{arrived};
}

}  // namespace epinspect
