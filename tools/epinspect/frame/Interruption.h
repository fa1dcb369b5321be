// Interruptions of what must not be left half done.
#pragma once

namespace epinspect {

/// From now on the first SIGINT, SIGTERM or SIGHUP that would end the program is only remembered, so that a work in
/// progress can come to an orderly end. The second one ends the program.
void holdInterruptions();

/// Whether there was one.
bool isInterrupted() noexcept;

}  // namespace epinspect
