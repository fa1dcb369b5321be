// The line on standard error, where that is a terminal, that shows how far a work has come. There is only one, and it
// never mixes with what else is written there.
#pragma once

#include <string_view>

namespace epinspect {

/// Shows `text` in place of what the line showed before. The signals that end the program erase it too.
void showStatusLine(std::string_view text);

/// Erases the line. May be called in a signal handler.
void eraseStatusLine() noexcept;

/// Writes all of `text` to the file descriptor `stream`; may be called in a signal handler. Returns 0 or the errno
/// value of the write that failed, EINTR when interruption() did it.
int writeAll(int stream, std::string_view text) noexcept;

}  // namespace epinspect
