// Parts of epinspect on their own: numbers, the system log, progress, memory that runs out, characters that deceive.
#include <fcntl.h>

#include <clocale>
#include <cstdarg>
#include <cstdlib>
#include <map>
#include <new>
#include <stdexcept>
#include <thread>

#include "InProcess.h"
#include "ProgramTest.h"
#include "commands/MapArguments.h"
#include "frame/CommandLine.h"
#include "frame/Numbers.h"
#include "frame/Output.h"
#include "frame/Progress.h"
#include "frame/Session.h"

using namespace epinspect;

namespace {

std::string forwarded;                  ///< what went to the system log
std::uint64_t memoryLeft = UINT64_MAX;  ///< how many calls of operator new still succeed

}  // namespace

/// What the program's syslog() calls, and what it calls in a hardened build.
void keepForwarded(int priority, const char* format, va_list arguments) __asm__("vsyslog");
[[gnu::visibility("default"), gnu::format(printf, 2, 0)]] void keepForwarded(int priority, const char* format,
                                                                             va_list arguments) {
    char text[100];
    std::vsnprintf(text, sizeof text, format, arguments);
    forwarded += std::to_string(priority) + " " + text + "\n";
}
extern "C" [[gnu::visibility("default"), gnu::format(printf, 3, 0)]] void __vsyslog_chk(  // NOLINT
    int priority, int /*flag*/, const char* format, va_list arguments) {
    keepForwarded(priority, format, arguments);
}
extern "C" void syslog(int priority, const char* format, ...);

[[gnu::noinline]] void* operator new(std::size_t size) {
    if (memoryLeft == 0) throw std::bad_alloc();
    --memoryLeft;
    return std::malloc(size);
}
[[gnu::noinline]] void* operator new(std::size_t size, const std::nothrow_t&) noexcept {
    if (memoryLeft == 0) return nullptr;
    --memoryLeft;
    return std::malloc(size);
}
[[gnu::noinline]] void operator delete(void* memory) noexcept { std::free(memory); }
[[gnu::noinline]] void operator delete(void* memory, std::size_t) noexcept { std::free(memory); }

// clang-format off
TEST(Numbers, AreReadWholeOrRefused) {
    const auto expect = [](const auto& parse, const std::map<std::string, std::uint64_t>& right, const auto&... wrong) {
        for (const auto& [text, number] : right) EXPECT_EQ(number, parse(text)) << text;
        for (const char* text : {wrong...}) EXPECT_THROW(parse(text), UsageError) << text;
    };
    const auto last = [](const std::string& text) { return parseRange(text).first == 5 ? parseRange(text).last : 0; };
    const auto last32 = [](const std::string& text) { return parseRange32(text).last; };
    expect(parseNumber, {{"0", 0}, {"007", 7}, {"0x1F", 31}, {"0Xa", 10}, {"18446744073709551615", UINT64_MAX}},
           "", "0x", "x1", "1x", " 1", "1 ", "-1", "+1", "1K", "0x-1", "18446744073709551616");
    expect(parseSize, {{"8", 8}, {"3K", 3072}, {"0x10M", 16777216}, {"1G", 1073741824}, {"2T", 2199023255552},
                       {"1KiB", 1024}, {"1MiB", 1048576}, {"1GiB", 1073741824}, {"1TiB", 1099511627776},
                       {"16777215T", 18446742974197923840U}}, "K", "1KB", "1kib", "1KiBx", "1KK", "1E", "16777216T");
    const auto lastPosition = [](const std::string& text) { return parsePositions(text).last; };
    expect(lastPosition, {{"5-2K", 2048}, {"9223372036854775807", INT64_MAX}}, "9223372036854775808");
    expect(last, {{"5", 5}, {"5-5", 5}, {"5-0x9", 9}, {"5-18446744073709551615", UINT64_MAX}},
           "6-5", "5-", "-5", "1-2-3", "-", "0-18446744073709551616");
    expect(parseNumber32, {{"4294967295", UINT32_MAX}}, "4294967296");
    expect(parseExtentSize, {{"4194303K", 4294966272U}}, "4194304K", "0");
    expect(last32, {{"0-4294967295", UINT32_MAX}}, "0-4294967296");
}
// clang-format on

TEST(SystemLog, GetsEveryLineButThoseAboutACopyAndThoseOfIdsTriedOut) {
    forwarded.clear();
    syslog(3, "line %d", 1);
    Session ofACopy;
    setenv("KELPISCSIEP_LUNS", "/dev/null", 1);
    EXPECT_EQ(1, runHere({"epinspect", "lun", "1-3"}));
    syslog(4, "line %d", 2);
    ofACopy.setRoot(".");
    syslog(3, "line %d", 3);
    EXPECT_EQ("3 line 1\n4 line 2\n", forwarded);
}

TEST(Progress, TellsHowFarAndHowLongAndIsGoneAtTheEnd) {
    const auto work = [] {
        Progress beside("entries", 400, Progress::Beside::listing), progress("entries", 400, Progress::Beside::nothing);
        progress.show(1);
        std::this_thread::sleep_for(std::chrono::milliseconds(1050));
        beside.show(160);
        for (const std::uint64_t done : {0U, 160U, 320U}) progress.show(done);
    };
    EXPECT_EQ(" 40%  160 of 400 entries, 2 s \r\033[K=0", Terminal(31, work).shown());
}

TEST(Program, SaysThatMemoryRanOut) {
    const auto work = [] { _exit(runHere({"epinspect"}, [] { memoryLeft = 0; })); };
    EXPECT_EQ("epinspect: out of memory\n=1", Terminal(80, work).shown());
}

/// The exit status of a run in which memory lasts for so many pieces, and not for the next one.
int statusOf(const std::vector<const char*>& words, std::uint64_t pieces) {
    const pid_t child = fork();
    if (child == 0) {
        dup2(open("/dev/null", O_WRONLY), STDOUT_FILENO);
        dup2(STDOUT_FILENO, STDERR_FILENO);
        _exit(runHere(words, [pieces] { memoryLeft = pieces; }));
    }
    int status = 0;
    EXPECT_EQ(child, waitpid(child, &status, 0));
    return exitStatus(status);
}

using ProgramOnStore = ProgramTest;

TEST_F(ProgramOnStore, EndsInOrderWhereverMemoryRunsOut) {
    const std::string root = path("store");
    unsetenv("KELPISCSIEP_LUNS");
    std::uint64_t pieces = 0;
    int status = 1;
    for (; status == 1; ++pieces) {
        status = statusOf({"epinspect", "--root", root.c_str(), "list", "--luns", "1-2"}, pieces);
    }
    EXPECT_EQ(0, status) << pieces;
    EXPECT_GT(pieces, 300U);
    write("full/a name of some length", EPFileBuilder::table());
    const std::string full = path("full");
    for (pieces = 0; pieces < 300; ++pieces)
        EXPECT_EQ(1, statusOf({"epinspect", "collect", full.c_str()}, pieces)) << pieces;
}

TEST_F(ProgramOnStore, NeverTakesForSoundWhatMemoryDidNotHold) {
    const std::string root = path("store");
    unsetenv("KELPISCSIEP_LUNS");
    for (const std::vector<const char*>& words :
         {std::vector<const char*>{"check"}, {"usage"}, {"owner", "/volume1/@iSCSI/EP/EP_DAT_00000", "30000"}}) {
        std::vector<const char*> all = {"epinspect", "--root", root.c_str()};
        all.insert(all.end(), words.begin(), words.end());
        int status = 1;
        std::uint64_t pieces = 1;
        for (; status == 1 && pieces < 1000000; pieces += 1 + pieces / 8) status = statusOf(all, pieces);
        EXPECT_EQ(0, status) << words[0] << ' ' << pieces;
        EXPECT_GT(pieces, 300U) << words[0];
    }
}

TEST(CommandLine, TakesNoShortOptionWithAValue) {
    std::uint64_t value = 0;
    for (const char* name : {"-f", "-f, --first", "--first, -f"}) {
        EXPECT_THROW(Command("", "").option(name, "N", "", value, parseNumber), std::logic_error) << name;
    }
}

TEST(Output, EscapesPrintableCharactersThatAreInvisibleOrTurnTheDirection) {
    const std::wstring escaped =                                         // the first and the last of each kind
        L"\u00ad\u034f\u0600\u0605\u061c\u06dd\u070f\u0890\u0891\u08e2"  // soft hyphen, joiner, Arabic and Syriac marks
        L"\u115f\u1160\u3164\uffa0\u17b4\u17b5"                          // Hangul fillers, Khmer vowels
        L"\u180b\u180f\ufe00\ufe0f\U000e0001\U000e0100\U000e0fff"        // variation selectors, tags
        L"\u200b\u200f\u202a\u202e\u2060\u206f\ufeff"                    // of no width, directions, joiners
        L"\u2800\ufff9\ufffb"                                            // braille without dots, annotations
        L"\U000110bd\U000110cd\U00013430\U0001343f"                      // Kaithi, hieroglyphs
        L"\U0001bca0\U0001bca3\U0001d173\U0001d17a";                     // shorthand, music
    const std::wstring shown =                                           // beside these
        L"\u00a0\u00ac\u00ae\u034e\u0350\u0606\u061b\u06dc\u06de\u0710\u08e1\u08e3\u115e\u1161\u3163\u3165\uff9f\uffa1"
        L"\u17b3\u17b6\u180a\u1810\ufdff\ufe10\u200a\u2010\u2027\u202f\u205f\u2070\u27ff\u2801\ufffc\ufffd"
        L"\U000110bc\U000110be\U0001bc9f\U0001d172\U0001d17b\u00e4\u4e2d";
    ASSERT_NE(nullptr, std::setlocale(LC_CTYPE, "C.UTF-8"));
    for (const wchar_t character : escaped + shown) {
        char bytes[16];
        std::mbstate_t state = {};
        const std::string text(bytes, std::wcrtomb(bytes, character, &state));
        EXPECT_EQ(escaped.find(character) == std::wstring::npos, printable(text) == text)
            << std::hex << static_cast<unsigned int>(character);
    }
}
