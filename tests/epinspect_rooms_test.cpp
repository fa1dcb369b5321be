// The rooms of epinspect on their own: numbers, runs, the chart, the system log, progress.
#include <fcntl.h>

#include <clocale>
#include <cstdarg>
#include <cstdlib>
#include <cwctype>
#include <map>
#include <new>
#include <set>
#include <sstream>
#include <stdexcept>
#include <thread>

#include "InProcess.h"
#include "ProgramTest.h"
#include "commands/MapChart.h"
#include "frame/CommandLine.h"
#include "frame/Numbers.h"
#include "frame/Output.h"
#include "frame/Progress.h"
#include "frame/Session.h"
#include "map/MapRuns.h"

using namespace epinspect;

namespace {

using Numbers = std::map<std::string, std::uint64_t>;

std::string forwarded;                  ///< what went to the system log
std::uint64_t memoryLeft = UINT64_MAX;  ///< how often operator new does not fail yet

/// "FIRST+COUNT@ADDRESS " of each run in the blocks of entries.
std::string runsOf(const std::vector<std::vector<MapEntry>>& blocks) {
    std::ostringstream text;
    const auto emit = [&text](const MapRun& run) {
        text << run.first << '+' << run.count << '@' << run.entry.extentAddress << ' ';
    };
    MapRuns runs;
    std::uint64_t first = 0;
    for (const auto& block : blocks) runs.add(std::exchange(first, first + block.size()), block, emit);
    runs.finish(emit);
    return text.str();
}

}  // namespace

/// What the program's syslog() calls, and what a hardened build makes of that.
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
[[gnu::noinline]] void operator delete(void* memory) noexcept { std::free(memory); }
[[gnu::noinline]] void operator delete(void* memory, std::size_t) noexcept { std::free(memory); }

// clang-format off
TEST(Numbers, AreDecimalOrHexadecimalAndNothingElse) {
    for (const auto& [text, number] : Numbers{{"0", 0}, {"007", 7}, {"0x1F", 31}, {"0Xa", 10},
                                              {"18446744073709551615", UINT64_MAX}})
        EXPECT_EQ(number, parseNumber(text)) << text;
    for (const char* text : {"", "0x", "x1", "1x", " 1", "1 ", "-1", "+1", "1K", "0x-1", "18446744073709551616"})
        EXPECT_THROW(parseNumber(text), UsageError) << text;
    EXPECT_EQ(UINT32_MAX, parseNumber32("4294967295"));
    EXPECT_THROW(parseNumber32("4294967296"), UsageError);
}

TEST(Numbers, OfBytesMayHaveAUnit) {
    for (const auto& [text, size] : Numbers{{"8", 8}, {"3K", 3072}, {"0x10M", 16777216}, {"1G", 1073741824},
                                            {"2T", 2199023255552}, {"1KiB", 1024}, {"1MiB", 1048576},
                                            {"1GiB", 1073741824}, {"1TiB", 1099511627776},
                                            {"16777215T", 18446742974197923840U}})
        EXPECT_EQ(size, parseSize(text)) << text;
    for (const char* text : {"K", "1KB", "1kib", "1KiBx", "1KK", "1E", "16777216T"})
        EXPECT_THROW(parseSize(text), UsageError) << text;
    EXPECT_EQ(4294966272U, parseSize32("4194303K"));
    EXPECT_THROW(parseSize32("4194304K"), UsageError);
}

TEST(Numbers, OfARangeDoNotRunBackwards) {
    for (const auto& [text, last] : Numbers{{"5", 5}, {"5-5", 5}, {"5-0x9", 9}, {"5-18446744073709551615", UINT64_MAX}})
        EXPECT_TRUE(parseRange(text).first == 5 && parseRange(text).last == last) << text;
    for (const char* text : {"6-5", "5-", "-5", "1-2-3", "-", "0-18446744073709551616"})
        EXPECT_THROW(parseRange(text), UsageError) << text;
    EXPECT_EQ(UINT32_MAX, parseRange32("0-4294967295").last);
    EXPECT_THROW(parseRange32("0-4294967296"), UsageError);
}
// clang-format on

TEST(Runs, MergeNeighboursThatAreAlike) {
    const MapEntry hole, entry(7, 1, true, false, false, false), next(8, 1, true, false, false, false);
    EXPECT_EQ("0+2@7 2+1@8 ", runsOf({{entry, next, next}}));
    EXPECT_EQ("0+3@7 ", runsOf({{entry, next}, {{9, 1, true, false, false, false}}}));
    EXPECT_EQ("0+3@0 ", runsOf({{hole, hole}, {}, {hole}}));
    for (const MapEntry& other : {entry, hole, MapEntry(6, 1, true, false, false, false),
                                  MapEntry(9, 1, true, false, false, false), MapEntry(8, 2, true, false, false, false),
                                  MapEntry(8, 1, false, false, false, false), MapEntry(8, 1, true, true, false, false),
                                  MapEntry(8, 1, true, false, true, false), MapEntry(8, 1, true, false, false, true)}) {
        const std::string runs = "0+1@7 1+1@" + std::to_string(other.extentAddress) + " ";
        EXPECT_EQ(runs, runsOf({{entry, other}})) << other.toString();
        EXPECT_EQ(runs, runsOf({{entry}, {other}})) << other.toString() << "in another block";
    }
    const MapEntry hasPool(0, 5, false, false, false, false), synced(0, 0, false, false, false, true);
    EXPECT_EQ("0+1@0 1+1@0 2+1@0 3+1@0 4+2@0 ", runsOf({{hole, hasPool, hasPool, synced, hole, hole}}));
}

TEST(Chart, ShadesACellByItsShareOfMappedEntries) {
    MapChart chart(0, 6160, 40);  // 16 rows of 33 cells, of 12 entries each; the last cell has but 4
    for (const unsigned int mapped : {0U, 1U, 3U, 4U, 7U, 8U, 11U, 12U}) {
        chart.add(true, mapped);
        chart.add(false, 12 - mapped);
    }
    chart.add(false, 6160 - 8 * 12 - 4);
    chart.add(true, 4);
    const std::string drawn = chart.draw(false);
    EXPECT_EQ("   0 |.--++**#.........................|\n 396 |", drawn.substr(0, 47));
    EXPECT_EQ("   0 |·░░▒▒▓▓█·", chart.draw(true).substr(0, 31));
    EXPECT_EQ(
        "\n5940 |..................#|\nOne cell: 12 entries\n"
        "Mapped: . none  - <1/3  + <2/3  * most\n        # all\n",
        drawn.substr(drawn.rfind("\n5940")));
}

TEST(Chart, StartsRowsWithAnIndexHoweverNarrow) {
    MapChart wide(95, 10, 80), narrow(68, 32, 2);
    wide.add(true, 10);
    narrow.add(true, 32);
    EXPECT_EQ(" 95 |##########|\nOne cell: 1 entry\n", wide.draw(false).substr(0, 35));
    EXPECT_EQ(" 68 |#|\n 70 |#|\n 72 |#|\n", narrow.draw(false).substr(0, 24));
}

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

/// What a run ends with in which memory lasts for so many pieces, and none for the next one.
int statusOfList(const char* root, std::uint64_t pieces) {
    const pid_t child = fork();
    if (child == 0) {
        dup2(open("/dev/null", O_WRONLY), STDOUT_FILENO);
        dup2(STDOUT_FILENO, STDERR_FILENO);
        _exit(runHere({"epinspect", "--root", root, "list", "--luns", "1-2"}, [pieces] { memoryLeft = pieces; }));
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
    for (; status == 1; ++pieces) status = statusOfList(root.c_str(), pieces);
    EXPECT_EQ(0, status) << pieces;
    EXPECT_GT(pieces, 300U);
}

TEST(CommandLine, TakesNoShortOptionWithAValue) {
    std::uint64_t value = 0;
    for (const char* name : {"-f", "-f, --first", "--first, -f"}) {
        EXPECT_THROW(Command("", "").option(name, "N", "", value, parseNumber), std::logic_error) << name;
    }
}

TEST(Output, EscapesEveryPrintableCharacterThatIsInvisibleOrTurnsTheDirection) {
    std::set<std::uint32_t> invisible = {0x2800};  // the braille pattern without dots; the others as Unicode has them
    FILE* properties =
        popen(R"(perl -e 'for (160..0x10FFFF) { print "$_ " if chr =~ /\p{DI}|\p{Cf}|\p{Zl}|\p{Zp}/ }')", "r");
    for (std::uint32_t number = 0; std::fscanf(properties, "%u", &number) == 1;) invisible.insert(number);
    EXPECT_EQ(0, pclose(properties));
    ASSERT_NE(nullptr, std::setlocale(LC_CTYPE, "C.UTF-8"));
    for (wchar_t character = 160; character <= 0x10FFFF; ++character) {
        if (std::iswprint(static_cast<std::wint_t>(character)) == 0) continue;
        char bytes[16];
        std::mbstate_t state = {};
        const std::string text(bytes, std::wcrtomb(bytes, character, &state));
        ASSERT_EQ(invisible.count(static_cast<std::uint32_t>(character)) == 0, printable(text) == text) << character;
    }
}
