#include "frame/Output.h"

#include <fcntl.h>
#include <langinfo.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <charconv>
#include <csignal>
#include <cstdlib>
#include <cstring>
#include <cwchar>
#include <cwctype>
#include <system_error>

#include "frame/Interruption.h"
#include "frame/StatusLine.h"

namespace epinspect {

namespace {

constexpr std::size_t bufferSize = 65536;
char buffer[bufferSize];
std::size_t buffered = 0;
int outputError = 0;  ///< errno of the first write that failed

void flushOutput() noexcept {
    if (outputError == 0) outputError = writeAll(STDOUT_FILENO, {buffer, buffered});
    buffered = 0;
}

/// Characters that count as printable but show nothing, or change the direction of what follows.
bool deceives(std::wint_t character) {
    struct Range {
        unsigned int first, last;
    };
    static constexpr Range ranges[] = {
        {0xAD, 0xAD},       {0x34F, 0x34F},     {0x600, 0x605},     {0x61C, 0x61C},     {0x6DD, 0x6DD},
        {0x70F, 0x70F},     {0x890, 0x891},     {0x8E2, 0x8E2},     {0x115F, 0x1160},   {0x17B4, 0x17B5},
        {0x180B, 0x180F},   {0x200B, 0x200F},   {0x2028, 0x202E},   {0x2060, 0x206F},   {0x2800, 0x2800},
        {0x3164, 0x3164},   {0xFE00, 0xFE0F},   {0xFEFF, 0xFEFF},   {0xFFA0, 0xFFA0},   {0xFFF0, 0xFFFB},
        {0x110BD, 0x110BD}, {0x110CD, 0x110CD}, {0x13430, 0x1343F}, {0x1BCA0, 0x1BCA3}, {0x1D173, 0x1D17A},
        {0xE0000, 0xE0FFF},
    };
    return std::any_of(std::begin(ranges), std::end(ranges),
                       [character](const Range& range) { return range.first <= character && character <= range.last; });
}

bool isHarmful(std::wint_t character) { return std::iswprint(character) == 0 || deceives(character); }

void appendEscaped(std::string& text, std::string_view bytes) {
    static constexpr char digits[] = "0123456789abcdef";
    for (const char c : bytes) {
        const auto byte = static_cast<unsigned char>(c);
        text.append("\\x").append(1, digits[byte >> 4U]).append(1, digits[byte & 0xFU]);
    }
}

}  // namespace

void prepareStreams() {
    for (const int stream : {STDIN_FILENO, STDOUT_FILENO, STDERR_FILENO}) {
        // Opened for reading, so that what is written to a missing stream still fails.
        if (fcntl(stream, F_GETFD) == -1 && errno == EBADF) static_cast<void>(open("/dev/null", O_RDONLY));
    }
    std::signal(SIGPIPE, SIG_IGN);
    std::signal(SIGXFSZ, SIG_IGN);
}

void print(std::string_view text) {
    static const bool terminal = outputIsTerminal();
    if (text.size() >= bufferSize) {  // nothing is won by copying it
        flushOutput();
        if (outputError == 0) outputError = writeAll(STDOUT_FILENO, text);
        text = {};
    }
    while (!text.empty()) {
        const auto part = text.substr(0, bufferSize - buffered);
        std::memcpy(buffer + buffered, part.data(), part.size());
        buffered += part.size();
        text.remove_prefix(part.size());
        if (buffered == bufferSize || terminal) flushOutput();
    }
    if (outputError == EINTR) checkInterruption();
    if (outputError != 0) throw OutputFailure{outputError};
}

void finishOutput() {
    flushOutput();
    if (outputError != 0) throw OutputFailure{outputError};
}

bool outputIsTerminal() { return isatty(STDOUT_FILENO) == 1; }

unsigned int terminalWidth(int stream) {
    winsize size = {};
    if (ioctl(stream, TIOCGWINSZ, &size) == 0 && size.ws_col > 0) return size.ws_col;
    const char* const columns = std::getenv("COLUMNS");  // NOLINT(concurrency-mt-unsafe): there is one thread
    const std::string_view text = columns != nullptr ? columns : "";
    std::uint16_t width = 0;  // as wide as a terminal can be
    const auto result = std::from_chars(text.data(), text.data() + text.size(), width);
    const bool isNumber = result.ec == std::errc() && result.ptr == text.data() + text.size();
    return isNumber && width > 0 ? width : 80;
}

unsigned int outputWidth() { return terminalWidth(STDOUT_FILENO); }

bool outputIsUnicode() { return std::strcmp(nl_langinfo(CODESET), "UTF-8") == 0; }

std::string printable(std::string_view text) {
    std::string result;
    std::mbstate_t state = {};
    while (!text.empty()) {
        wchar_t character = 0;
        auto length = std::mbrtowc(&character, text.data(), text.size(), &state);
        if (length == 0 || length > text.size()) {  // a NUL, or no character
            length = 1;
            state = {};
            appendEscaped(result, text.substr(0, 1));
        } else if (isHarmful(static_cast<std::wint_t>(character))) {
            appendEscaped(result, text.substr(0, length));
        } else {
            result.append(text.substr(0, length));
        }
        text.remove_prefix(length);
    }
    return result;
}

std::string forReader(std::string_view text) { return outputIsTerminal() ? printable(text) : std::string(text); }

std::string counted(std::uint64_t count, const char* one, const char* several) {
    return std::to_string(count) + " " + (count == 1 ? one : several);
}

std::string wrapped(const std::vector<std::string_view>& pieces, unsigned int width, unsigned int indent,
                    std::string_view gap) {
    const auto columns = [](std::string_view piece) {  // each character counts as one column, which few are not
        return static_cast<std::size_t>(std::count_if(
            piece.begin(), piece.end(), [](char c) { return (static_cast<unsigned char>(c) & 0xC0U) != 0x80U; }));
    };
    std::string result;
    std::string line;
    bool first = true;
    for (const std::string_view piece : pieces) {
        if (!first && columns(line) + columns(gap) + columns(piece) > width) {
            result.append(line).append("\n");
            line.assign(indent, ' ').append(piece);
        } else {
            line.append(first ? "" : gap).append(piece);
        }
        first = false;
    }
    return result + line + "\n";
}

std::string wrapped(std::string_view text, unsigned int width, unsigned int indent, std::string_view gap) {
    std::vector<std::string_view> pieces;
    for (auto end = text.find(gap); end != std::string_view::npos; end = text.find(gap)) {
        pieces.push_back(text.substr(0, end));
        text.remove_prefix(end + gap.size());
    }
    pieces.push_back(text);
    return wrapped(pieces, width, indent, gap);
}

void complain(std::string_view message) {
    const std::string line = "epinspect: " + printable(message) + "\n";
    flushOutput();
    eraseStatusLine();
    writeAll(STDERR_FILENO, line);
}

void complainPlainly(std::initializer_list<const char*> pieces) noexcept {
    flushOutput();
    eraseStatusLine();
    writeAll(STDERR_FILENO, "epinspect: ");
    for (const char* piece : pieces) writeAll(STDERR_FILENO, piece);
    writeAll(STDERR_FILENO, "\n");
}

}  // namespace epinspect
