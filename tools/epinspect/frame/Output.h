// What epinspect says: data to standard output, messages to standard error.
#pragma once

#include <cstdint>
#include <initializer_list>
#include <string>
#include <string_view>
#include <vector>

namespace epinspect {

/// Standard output could not be written; `error` is the errno value.
struct OutputFailure {
    int error;
};

/// Prepares the standard streams: one that is closed is opened on /dev/null, so that no other file takes its number,
/// but a write to it fails; and a write that fails is an error, never a signal.
void prepareStreams();

/// Writes data to standard output: at once to a terminal, otherwise in large pieces. Throws OutputFailure, and
/// Interrupted when a signal ended the wait for somebody to take it.
void print(std::string_view text);

/// Makes sure that all data has arrived. Throws OutputFailure.
void finishOutput();

/// Whether standard output is a terminal.
bool outputIsTerminal();

/// The width of the terminal that `stream` (a file descriptor) is. Where that is not known, COLUMNS in the environment
/// says it; else it is 80.
unsigned int terminalWidth(int stream);

/// The same for standard output.
unsigned int outputWidth();

/// Whether the user's character set is UTF-8.
bool outputIsUnicode();

/// `text` with everything that could disturb or deceive the reader of a terminal written as \xNN.
std::string printable(std::string_view text);

/// `text` as data: unchanged for a program that reads it, printable for a person.
std::string forReader(std::string_view text);

/// "1 entry", "2 entries".
std::string counted(std::uint64_t count, const char* one, const char* several);

/// `pieces` with `gap` between them, in lines of at most `width` columns; every line but the first starts with `indent`
/// blanks, every line ends with a line feed. No piece is broken, however long it is.
std::string wrapped(const std::vector<std::string_view>& pieces, unsigned int width, unsigned int indent,
                    std::string_view gap);

/// The same of a text, whose pieces stand between its gaps.
std::string wrapped(std::string_view text, unsigned int width, unsigned int indent, std::string_view gap = " ");

/// Writes "epinspect: MESSAGE" to standard error, after all data that came before.
void complain(std::string_view message);

/// The same from pieces that can be shown as they are; takes no memory.
void complainPlainly(std::initializer_list<const char*> pieces) noexcept;

}  // namespace epinspect
