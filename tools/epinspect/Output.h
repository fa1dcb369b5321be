// What epinspect says: data to standard output, messages to standard error.
#pragma once

#include <string>
#include <string_view>

namespace epinspect {

/// Standard output could not be written; `error` is the errno value.
struct OutputFailure {
    int error;
};

/// Writes data to standard output. Throws OutputFailure.
void print(std::string_view text);

/// Makes sure that all data has arrived. Throws OutputFailure.
void finishOutput();

/// Whether standard output is a terminal.
bool outputIsTerminal();

/// `text` with everything that could disturb a terminal written as \xNN.
std::string printable(std::string_view text);

/// `text` as data: unchanged for a program that reads it, printable for a person.
std::string forReader(std::string_view text);

/// Writes "epinspect: MESSAGE" to standard error.
void complain(std::string_view message);

/// Writes "epinspect: SUBJECT: WHAT FAILED (NAME, CODE)" for an error code of the library.
void complain(std::string_view subject, int error);

}  // namespace epinspect
