// The line on standard error, a terminal, that shows how far a work has come. There is one, and it never mixes with
// what is written there.
#pragma once

#include <string_view>

namespace epinspect {

/// Shows `text` in place of what the line showed before. The signals that end the program erase it too.
void showStatusLine(std::string_view text);

/// Takes the line away. May be called in a signal handler.
void eraseStatusLine() noexcept;

/// Writes all of `text` to the file descriptor `stream`; may be called in a signal handler. Returns 0 or the errno
/// value of the write that failed, EINTR when interruption() did it.
int writeAll(int stream, std::string_view text) noexcept;

}  // namespace epinspect
