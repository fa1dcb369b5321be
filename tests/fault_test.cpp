// Reads that fail or come short, files that shrink under a read, memory that runs out: each becomes an error code.
#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileMAP.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cerrno>
#include <cstdlib>
#include <new>

#include "Support.h"

using namespace ISCSI::TOOL;
using epsample::EPFileBuilder;

namespace {

enum class Fault { NONE, FAIL, SHRINK, COME_SHORT };

Fault fault = Fault::NONE;  ///< what happens to the file at read number `faultyRead`
int faultyRead = 0, readsSeen = 0;
int allocationsAllowed = -1, allocationsLeft = -1;  ///< operator new fails when none is left; below 0: it does not

/// While one lives, memory is scarce.
struct Scarcity {
    Scarcity() { allocationsLeft = allocationsAllowed; }
    ~Scarcity() { allocationsLeft = -1; }
};

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

void* operator new(std::size_t size) {
    if (allocationsLeft == 0) throw std::bad_alloc();
    if (allocationsLeft > 0) --allocationsLeft;
    if (void* memory = std::malloc(size)) return memory;
    throw std::bad_alloc();
}
void operator delete(void* memory) noexcept {
    std::free(memory);
}
void operator delete(void* memory, std::size_t) noexcept {
    std::free(memory);
}

namespace {

constexpr std::uint64_t entryCount = 20000;  // three reads of getMapEntries

/// The operations that read, on fresh objects; each tells its code, and whether a failure has touched the result.
struct Operation {
    const char* name;
    int (*run)(const std::string& map, const std::string& data, bool& touched);
};

const Operation operations[] = {{"parseFile",
                                 [](const std::string& map, const std::string&, bool& touched) {
                                     ISCSIEPFileMAP file(map);
                                     const Scarcity scarcity;
                                     const int code = file.parseFile();
                                     touched =
                                         file.poolUUIDs.size() == 2;  // one that was appended before a failure may stay
                                     return code;
                                 }},
                                {"getMapEntry",
                                 [](const std::string& map, const std::string&, bool& touched) {
                                     ISCSIEPMapEntryInfo entry(1, 1, true, true, true, true);
                                     ISCSIEPFileMAP file(map);
                                     const Scarcity scarcity;
                                     const int code = file.getMapEntry(entryCount - 1, entry);
                                     touched = !entry.mapped;
                                     return code;
                                 }},
                                {"getMapEntries",
                                 [](const std::string& map, const std::string&, bool& touched) {
                                     std::vector<ISCSIEPMapEntryInfo> entries;
                                     ISCSIEPFileMAP file(map);
                                     const Scarcity scarcity;
                                     const int code = file.getMapEntries(0, entryCount, entries);
                                     touched = !entries.empty();
                                     return code;
                                 }},
                                {"getExtentData", [](const std::string&, const std::string& data, bool& touched) {
                                     std::string text;
                                     ISCSIEPFileDAT file(data);
                                     const Scarcity scarcity;
                                     const int code = file.getExtentData(1, 65536, text);
                                     touched = !text.empty();
                                     return code;
                                 }}};

class Faults : public testing::Test {
protected:
    const TempDir folder;

    /// Runs an operation on whole files; afterwards no more files may be open than before.
    int run(const Operation& operation, bool& touched) {
        const std::string map = folder.write("map", EPFileBuilder::map().resize(24576 + 8 * entryCount));
        const std::string data = folder.write("data", EPFileBuilder::data().resize(24576 + 2 * 65536));
        const int before = dup(0);
        close(before);
        readsSeen = 0;
        const int code = operation.run(map, data, touched);
        const int after = dup(0);
        close(after);
        EXPECT_EQ(before, after) << operation.name;
        takeLog();
        return code;
    }
};

}  // namespace

TEST_F(Faults, ReadsThatFailComeShortOrMeetAShrunkFile) {
    for (const Operation& operation : operations) {
        for (const Fault kind : {Fault::FAIL, Fault::SHRINK, Fault::COME_SHORT}) {
            for (faultyRead = 1;; ++faultyRead) {
                bool touched = false;
                fault = kind;
                const int code = run(operation, touched);
                fault = Fault::NONE;
                if (readsSeen < faultyRead) break;  // no such read any more
                const bool wellRead = code == 0 && touched;
                const bool refused = code == EP_ERR_READ_FAILED && !touched;
                // A run of entries may end where the file now ends.
                const bool runEnded = kind == Fault::SHRINK && faultyRead > 2 && wellRead;
                EXPECT_TRUE(kind == Fault::COME_SHORT ? wellRead : refused || runEnded)
                    << operation.name << " read " << faultyRead << ": " << code;
            }
            EXPECT_LT(1, faultyRead);
        }
    }
}

TEST_F(Faults, MemoryThatRunsOut) {
    for (const Operation& operation : operations) {
        int code = -1;
        for (int allowed = 0; code != 0; ++allowed) {
            bool touched = false;
            allocationsAllowed = allowed;
            EXPECT_NO_THROW(code = run(operation, touched)) << operation.name;
            EXPECT_EQ(code == 0, touched) << operation.name << ' ' << allowed << ": " << code;
            ASSERT_LT(allowed, 1000);
        }
    }
}
