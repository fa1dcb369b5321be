// Reads that fail or come short, files that shrink under a read, memory that runs out: each becomes an error code.
#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileMAP.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <map>
#include <new>
#include <set>

#include "Support.h"

using namespace ISCSI::TOOL;
using epbuilder::EPFileBuilder;

namespace {

enum class Fault { NONE, FAIL, SHRINK, COME_SHORT };

Fault fault = Fault::NONE;  ///< what happens to the file at read number `faultyRead`
int faultyRead = 0, readsSeen = 0;
int allocationsAllowed = -1, allocationsLeft = -1;  ///< operator new fails when none is left; below 0: it does not

}  // namespace

extern "C" __attribute__((visibility("default"))) ssize_t read(int descriptor, void* bytes, std::size_t size) {
    if (++readsSeen == faultyRead) {
        if (fault == Fault::FAIL) {
            errno = EIO;
            return -1;
        }
        if (fault == Fault::COME_SHORT) size /= 2;
        const std::string path = "/proc/self/fd/" + std::to_string(descriptor);
        if (fault == Fault::SHRINK && truncate(path.c_str(), 0) != 0) std::abort();
    }
    return syscall(SYS_read, descriptor, bytes, size);
}

[[gnu::noinline]] void* operator new(std::size_t size) {
    if (allocationsLeft == 0 && !logging) throw std::bad_alloc();
    if (allocationsLeft > 0 && !logging) --allocationsLeft;
    if (void* memory = std::malloc(size)) return memory;
    throw std::bad_alloc();
}
[[gnu::noinline]] void operator delete(void* memory) noexcept { std::free(memory); }
[[gnu::noinline]] void operator delete(void* memory, std::size_t) noexcept { std::free(memory); }

namespace {

constexpr std::uint64_t entryCount = 20000;  // three reads of getMapEntries
constexpr int operationCount = 4;
std::set<std::string> logged;  ///< what all operations have logged, without the paths

/// Performs one of the operations that read, on whole files. Tells its code, and whether it has delivered a result.
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
    allocationsLeft = -1;
    // Pool UUIDs that were appended before a failure may stay.
    const bool delivered = mapFile.poolUUIDs.size() == 2 || entry.mapped || !entries.empty() || !text.empty();
    const int after = dup(0);
    close(after);
    EXPECT_EQ(before, after) << operation;
    for (const std::string& line : takeLog()) logged.insert(line.substr(0, line.find(" path:")));
    return {code, delivered};
}

}  // namespace

TEST(Faults, ReadsThatFailComeShortOrMeetAShrunkFile) {
    for (const Fault kind : {Fault::FAIL, Fault::SHRINK, Fault::COME_SHORT}) {
        for (int operation = 0; operation < operationCount; ++operation) {
            for (faultyRead = 1;; ++faultyRead) {
                fault = kind;
                const auto [code, delivered] = perform(operation);
                fault = Fault::NONE;
                if (readsSeen < faultyRead) break;  // no such read any more
                // What comes short is read on; a run of entries may end where the file now ends.
                const bool cutShort = kind == Fault::SHRINK && operation == 2 && faultyRead > 1;
                const bool succeeds = kind == Fault::COME_SHORT || cutShort;
                EXPECT_EQ(succeeds ? 0 : EP_ERR_READ_FAILED, code) << operation << " read " << faultyRead;
                EXPECT_EQ(succeeds && (!cutShort || faultyRead > 2), delivered) << operation << " read " << faultyRead;
            }
            EXPECT_LT(1, faultyRead);
        }
    }
}

TEST(Faults, MemoryThatRunsOut) {
    for (int operation = 0; operation < operationCount; ++operation) {
        std::pair<int, bool> outcome = {-1, false};
        for (allocationsAllowed = 0; outcome.first != 0; ++allocationsAllowed) {
            ASSERT_NO_THROW(outcome = perform(operation)) << operation;
            EXPECT_EQ(outcome.first == 0, outcome.second) << operation << ' ' << allocationsAllowed;
        }
    }
    allocationsAllowed = -1;
    EXPECT_EQ(1U, logged.count("iSCSI:ISCSIEPFile.cpp:80:parseHead0 Failed to get HEAD[0] UUID."));
    const std::map<std::string, std::string> uuids = {{"84", "HEAD[1] parent"},        {"114", "VAR[1] session"},
                                                      {"136", "VAR[2] track"},         {"140", "VAR[2] previous track"},
                                                      {"144", "VAR[2] current track"}, {"152", "SEG[0] #1 pool"}};
    for (const auto& [line, uuid] : uuids) {
        const std::string text = "iSCSI:ISCSIEPFileMAP.cpp:" + line + ":parseFile Failed to get " + uuid + " UUID.";
        EXPECT_EQ(1U, logged.count(text)) << text;
    }
}
