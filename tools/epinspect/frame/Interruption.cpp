#include "frame/Interruption.h"

#include <csignal>
#include <initializer_list>

namespace epinspect {

namespace {

volatile std::sig_atomic_t interrupted = 0;

extern "C" void remember(int /*signal*/) { interrupted = 1; }

}  // namespace

void holdInterruptions() {
    for (const int signal : {SIGINT, SIGTERM, SIGHUP}) {
        struct sigaction action = {};
        if (sigaction(signal, nullptr, &action) != 0 || action.sa_handler == SIG_IGN) continue;
        action = {};
        action.sa_handler = remember;
        action.sa_flags = static_cast<int>(SA_RESETHAND);
        sigaction(signal, &action, nullptr);
    }
}

bool isInterrupted() noexcept { return interrupted != 0; }

}  // namespace epinspect
