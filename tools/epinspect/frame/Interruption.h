// Interruptions of what must not be left half done.
#pragma once

namespace epinspect {

/// From now on the first SIGINT, SIGTERM or SIGHUP that would end the program is only remembered, so that a work in
/// progress can come to an orderly end. The second one ends the program.
void holdInterruptions();

/// The signal that was remembered, 0 before.
int interruption() noexcept;

/// Whether there was one.
inline bool isInterrupted() noexcept { return interruption() != 0; }

/// Thrown to end a work.
struct Interrupted {
    int signal;
};

/// Throws Interrupted when there was one.
void checkInterruption();

}  // namespace epinspect
