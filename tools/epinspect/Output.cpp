#include "Output.h"

#include <unistd.h>

#include <ISCSIEPFile.h>
#include <cerrno>
#include <cstdio>
#include <cwchar>
#include <cwctype>

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

struct ErrorText {
    int error;
    const char* name;
    const char* text;
};

constexpr ErrorText errorTexts[] = {
    {tool::EP_ERR_BAD_ARGUMENT, "EP_ERR_BAD_ARGUMENT", "no input"},
    {tool::EP_ERR_OPEN_FAILED, "EP_ERR_OPEN_FAILED", "cannot be opened"},
    {tool::EP_ERR_READ_FAILED, "EP_ERR_READ_FAILED", "cannot be read, or ends too early"},
    {tool::EP_ERR_SEEK_FAILED, "EP_ERR_SEEK_FAILED", "position out of any file's range"},
    {tool::EP_ERR_BAD_UUID, "EP_ERR_BAD_UUID", "UUID cannot be shown"},
    {tool::EP_ERR_WRONG_FILE_TYPE, "EP_ERR_WRONG_FILE_TYPE", "wrong type of EP file"},
    {tool::EP_ERR_NO_PATH, "EP_ERR_NO_PATH", "path names no volume"},
    {tool::EP_ERR_BAD_EXTENT_SIZE, "EP_ERR_BAD_EXTENT_SIZE", "extent size cannot be used"},
};

std::string describe(int error) {
    for (const ErrorText& row : errorTexts) {
        if (row.error == error) {
            return std::string(row.text) + " (" + row.name + ", " + std::to_string(error) + ")";
        }
    }
    return "configuration cannot be loaded (code " + std::to_string(error) + ")";
}

int outputError = 0;  ///< errno of the first flush that failed

void flushOutput() {
    if (std::fflush(stdout) != 0 && outputError == 0) outputError = errno;
}

void appendEscaped(std::string& text, unsigned char byte) {
    static constexpr char digits[] = "0123456789abcdef";
    text.append("\\x").append(1, digits[byte >> 4U]).append(1, digits[byte & 0xFU]);
}

}  // namespace

void print(std::string_view text) {
    if (std::fwrite(text.data(), 1, text.size(), stdout) != text.size()) throw OutputFailure{errno};
}

void finishOutput() {
    flushOutput();
    if (outputError != 0) throw OutputFailure{outputError};
}

bool outputIsTerminal() { return isatty(STDOUT_FILENO) == 1; }

std::string printable(std::string_view text) {
    std::string result;
    std::mbstate_t state = {};
    while (!text.empty()) {
        wchar_t character = 0;
        auto length = std::mbrtowc(&character, text.data(), text.size(), &state);
        if (length <= text.size() && length > 0 && std::iswprint(static_cast<std::wint_t>(character)) != 0) {
            result.append(text.substr(0, length));
        } else {
            length = 1;
            state = {};
            appendEscaped(result, static_cast<unsigned char>(text.front()));
        }
        text.remove_prefix(length);
    }
    return result;
}

std::string forReader(std::string_view text) { return outputIsTerminal() ? printable(text) : std::string(text); }

void complain(std::string_view message) {
    flushOutput();  // what came before is seen before
    const std::string line = "epinspect: " + printable(message) + "\n";
    static_cast<void>(std::fwrite(line.data(), 1, line.size(), stderr));
}

void complain(std::string_view subject, int error) { complain(std::string(subject) + ": " + describe(error)); }

}  // namespace epinspect
