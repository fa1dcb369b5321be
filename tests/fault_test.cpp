// Reads that fail or come short, files that shrink under a read, memory that runs out: each becomes an error code.
#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileMAP.h>
#include <fcntl.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <cstdarg>
#include <cstdlib>
#include <new>

#include "Fits.h"
#include "Support.h"

using namespace ISCSI::TOOL;
using epbuilder::EPFileBuilder;

namespace {

enum class Fault { NONE, FAIL, SHRINK, COME_SHORT, INTERRUPT };

Fault fault = Fault::NONE;  ///< what happens to the file at read number `faultyRead`
int faultyRead = 0, readsSeen = 0;
int allocationsAllowed = -1, allocationsLeft = -1;  ///< operator new fails when none is left; below 0: it does not
std::uint64_t allocated = 0;                        ///< bytes asked of operator new so far
int textsLeft = -1;                                 ///< when it gets to 0, snprintf() makes a text of 35 characters

}  // namespace

// read() itself, whatever a hardened build makes of that name, and snprintf().
ssize_t faultyReadCall(int descriptor, void* bytes, std::size_t size) __asm__("read");
__attribute__((visibility("default"))) ssize_t faultyReadCall(int descriptor, void* bytes, std::size_t size) {
    if (++readsSeen == faultyRead) {
        if (fault == Fault::FAIL || fault == Fault::INTERRUPT) {
            errno = fault == Fault::FAIL ? EIO : EINTR;
            return -1;
        }
        if (fault == Fault::COME_SHORT) size /= 2;
        const std::string path = "/proc/self/fd/" + std::to_string(descriptor);
        if (fault == Fault::SHRINK && truncate(path.c_str(), 0) != 0) std::abort();
    }
    EXPECT_EQ(FD_CLOEXEC, fcntl(descriptor, F_GETFD));
    return syscall(SYS_read, descriptor, bytes, size);
}

int snprintfCall(char* text, std::size_t size, const char* format, ...) __asm__("snprintf");
__attribute__((visibility("default"), format(printf, 3, 4))) int snprintfCall(char* text, std::size_t size,
                                                                              const char* format, ...) {
    va_list arguments;
    va_start(arguments, format);
    const int length = std::vsnprintf(text, size, format, arguments);
    va_end(arguments);
    return textsLeft >= 0 && textsLeft-- == 0 ? 35 : length;
}

[[gnu::noinline]] void* operator new(std::size_t size) {
    if (allocationsLeft == 0 && !logging) throw std::bad_alloc();
    if (allocationsLeft > 0 && !logging) --allocationsLeft;
    allocated += size;
    if (void* memory = std::malloc(size)) return memory;
    throw std::bad_alloc();
}
[[gnu::noinline]] void operator delete(void* memory) noexcept { std::free(memory); }
[[gnu::noinline]] void operator delete(void* memory, std::size_t) noexcept { std::free(memory); }

namespace {

constexpr std::uint64_t entryCount = 20000;  // three reads of getMapEntries
constexpr int operationCount = 4;
int reason = 0;  ///< what the last operation left in errno
Lines logged;    ///< and its log lines

/// Performs one of the operations that read, on whole files. Returns its code, and whether it has delivered a result.
/// Afterwards no more files may be open than before.
std::pair<int, bool> perform(int operation) {
    const TempDir folder;
    EPFileBuilder map = EPFileBuilder::map().entry(entryCount - 1, 0x8000000000000000);
    ISCSIEPFileMAP mapFile(folder.write("map", map));
    ISCSIEPFileDAT dataFile(folder.write("data", EPFileBuilder::data().resize(24576 + 2 * 65536)));
    ISCSIEPMapEntryInfo entry;
    std::vector<ISCSIEPMapEntryInfo> entries;
    std::string text;
    const int before = dup(0);
    close(before);
    readsSeen = 0;
    allocationsLeft = allocationsAllowed;
    const int code = operation == 0   ? mapFile.parseFile()
                     : operation == 1 ? mapFile.getMapEntry(entryCount - 1, entry)
                     : operation == 2 ? mapFile.getMapEntries(0, entryCount, entries)
                                      : dataFile.getExtentData(1, 65536, text);
    reason = errno;
    allocationsLeft = -1;
    // Pool UUIDs that were appended before a failure may stay.
    const bool delivered = mapFile.poolUUIDs.size() == 2 || entry.mapped || !entries.empty() || !text.empty();
    const int after = dup(0);
    close(after);
    EXPECT_EQ(before, after) << operation;
    logged = takeLog();
    return {code, delivered};
}

}  // namespace

TEST(Faults, ReadsThatFailComeShortOrMeetAShrunkFile) {
    for (const Fault kind : {Fault::FAIL, Fault::SHRINK, Fault::COME_SHORT, Fault::INTERRUPT}) {
        for (int operation = 0; operation < operationCount; ++operation) {
            for (faultyRead = 1;; ++faultyRead) {
                fault = kind;
                const auto [code, delivered] = perform(operation);
                fault = Fault::NONE;
                if (readsSeen < faultyRead) break;  // no such read any more
                // What comes short is read on; a run of entries may end where the file now ends.
                const bool cutShort = kind == Fault::SHRINK && operation == 2 && faultyRead > 1;
                const bool succeeds = kind == Fault::COME_SHORT || kind == Fault::INTERRUPT || cutShort;
                EXPECT_EQ(succeeds ? 0 : EP_ERR_READ_FAILED, code) << operation << " read " << faultyRead;
                EXPECT_TRUE(succeeds || operation != 2 || faultyRead == 1 ||
                            logged.at(0).find(":205:getMapEntries Failed to read file. path: ") != std::string::npos);
                EXPECT_TRUE(succeeds || reason == (kind == Fault::FAIL ? EIO : 0)) << operation << ' ' << reason;
                EXPECT_EQ(succeeds && (!cutShort || faultyRead > 2), delivered) << operation << " read " << faultyRead;
            }
            EXPECT_LT(1, faultyRead);
        }
    }
}

TEST(Faults, AnExtentTakesTheMemoryOfItsTextAndLittleMore) {
    constexpr unsigned int extentSize = 1048576;
    const TempDir folder;
    ISCSIEPFileDAT file(folder.write("data", EPFileBuilder::data().resize(24576 + 2 * extentSize)));
    std::string text;
    std::vector<unsigned char> bytes(extentSize);
    const std::uint64_t before = std::exchange(allocated, 0);
    EXPECT_LT(extentSize, before);
    EXPECT_EQ(0, file.getExtentData(1, extentSize, text));
    EXPECT_GE(2 * extentSize + 4096, allocated);
    allocated = 0;
    EXPECT_EQ(0, file.getExtentBytes(1, extentSize, 0, extentSize, bytes.data()));
    EXPECT_EQ(0U, allocated);
}

TEST(Faults, AUUIDThatCannotBeRenderedEndsTheParseWhereItStands) {
    struct Case {
        const char* message;
        unsigned char firstByte;
        std::size_t lines;  ///< of the dump, which stand before the UUID; nothing else has been stored
    };
    const Case cases[] = {{"ISCSIEPFile.cpp:80:parseHead0 Failed to get HEAD[0] UUID.", 0x40, 5},
                          {"ISCSIEPFileMAP.cpp:84:parseFile Failed to get HEAD[1] parent UUID.", 0x50, 13},
                          {"ISCSIEPFileMAP.cpp:114:parseFile Failed to get VAR[1] session UUID.", 0x60, 22},
                          {"ISCSIEPFileMAP.cpp:136:parseFile Failed to get VAR[2] track UUID.", 0x70, 28},
                          {"ISCSIEPFileMAP.cpp:140:parseFile Failed to get VAR[2] previous track UUID.", 0x80, 29},
                          {"ISCSIEPFileMAP.cpp:144:parseFile Failed to get VAR[2] current track UUID.", 0x90, 30},
                          {"ISCSIEPFileMAP.cpp:152:parseFile Failed to get SEG[0] #0 pool UUID.", 0xa0, 32},
                          {"ISCSIEPFileMAP.cpp:152:parseFile Failed to get SEG[0] #1 pool UUID.", 0xb0, 33}};
    const TempDir folder;
    ISCSIEPFileMAP whole(folder.write("map", EPFileBuilder::map()));
    const auto fresh = linesOf(whole.toString());
    EXPECT_EQ(0, whole.parseFile());
    const auto parsed = linesOf(whole.toString());
    int number = 0;
    for (const Case& c : cases) {
        ISCSIEPFileMAP file(whole.path);
        textsLeft = number++;
        const int code = file.parseFile();
        if (std::exchange(textsLeft, -1) >= 0) GTEST_SKIP() << "the library calls snprintf() by another name";
        EXPECT_EQ(18990209, code);
        EXPECT_EQ(0, errno);
        std::string bytes, expected;
        for (unsigned int i = 0; i < 16; ++i) bytes += static_cast<char>(c.firstByte + i);
        const Lines log = takeLog();
        ASSERT_LE(2U, log.size());
        EXPECT_EQ("iSCSI:ISCSIQuorinStringTool.h:138:GetUUIDInString Invalid UUID format: " + bytes, log[0]);
        EXPECT_EQ("iSCSI:" + std::string(c.message) + " path: " + file.path, log[1]);
        for (std::size_t i = 0; i < c.lines || i + 1 < fresh.size(); ++i)
            expected += (i < c.lines ? parsed : fresh)[i] + '\n';
        EXPECT_TRUE(fits(file.toString(), expected));
    }
}

TEST(Faults, MemoryThatRunsOut) {
    for (int operation = 0; operation < operationCount; ++operation) {
        std::pair<int, bool> outcome = {-1, false};
        for (allocationsAllowed = 0; outcome.first != 0; ++allocationsAllowed) {
            ASSERT_NO_THROW(outcome = perform(operation)) << operation;
            EXPECT_EQ(outcome.first == 0, outcome.second) << operation << ' ' << allocationsAllowed;
            EXPECT_TRUE(outcome.first == 0 || reason == ENOMEM) << operation << ' ' << allocationsAllowed;
        }
    }
    allocationsAllowed = -1;
}
