// Header blocks of all kinds: what is decoded and shown, and how reading them fails.
#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileFRI.h>
#include <ISCSIEPFileJNL.h>
#include <ISCSIEPFileMAP.h>
#include <ISCSIEPFileTBL.h>

#include <cstring>
#include <future>
#include <locale>

#include "Support.h"

using namespace ISCSI::TOOL;
using epbuilder::EPFileBuilder;

namespace {

/// A valid file of kind `File` is shown as HEAD[0] with `type` and `uuid`, then `sections`; an unreadable one leaves
/// the object as it was, and a chain of lines that ends with `line` of the class.
template <typename File>
void expectKind(const EPFileBuilder& builder, const std::string& type, const std::string& uuid,
                const std::string& sections, const std::string& line) {
    const TempDir folder;
    const std::string path = folder.write("file", builder);
    File file(path);
    const std::string fresh = file.toString();
    EXPECT_EQ(0, file.parseFile());
    const std::string head0 =
        "================ HEAD[0] ================\nchecksum:\t\t0xa1b2c3d\nversion:\t\t2\n"
        "magic code:\t\t0x1122334455667788\ntype:\t\t\t" +
        type + "\nUUID:\t\t\t" + uuid + "\ndata start offset:\t0x6000\ncreate time:\t\tSun Sep 13 12:26:40 UTC 2020\n";
    EXPECT_EQ(head0 + sections, static_cast<const ISCSIEPFile&>(file).toString());
    EXPECT_EQ(head0, file.ISCSIEPFile::toString());

    const auto expectFailure = [&](const std::string& unreadable, int code, const std::string& first) {
        File other(unreadable);
        EXPECT_EQ(code, other.parseFile()) << unreadable;
        EXPECT_EQ(chain(unreadable, {first, "ISCSIEPFile.cpp:59:parseHead0 Failed to read header.",
                                     line + ":parseFile Failed to get parse HEAD[0]."}),
                  takeLog());
        EXPECT_EQ(fresh, other.toString());
    };
    expectFailure("", 18990038, "ISCSIEPFile.cpp:37:readHeader Failed to open file.");
    expectFailure(path + "no%s%n", 18990038, "ISCSIEPFile.cpp:37:readHeader Failed to open file.");
    const std::string failedRead = "ISCSIEPFile.cpp:42:readHeader Failed to read file.";
    expectFailure(folder.path(""), 18990039, failedRead);
    expectFailure("/dev/null", 18990039, failedRead);
    for (std::uintmax_t size = 24576; size-- > 0;) {
        std::filesystem::resize_file(path, size);
        if (size % 1000 == 575 || size < 5) expectFailure(path, 18990039, failedRead);
        ASSERT_EQ(18990039, ISCSIEPFile(path).readHeader()) << size;
        takeLog();
    }
}

/// A locale that groups digits, as a caller may have made global.
struct Grouping : std::numpunct<char> {
    char do_thousands_sep() const override { return '.'; }
    std::string do_grouping() const override { return "\1"; }
};

}  // namespace

// clang-format off
TEST(EPFile, EveryKindIsDecodedAndShownWhateverTheGlobalLocale) {
    const std::locale before = std::locale::global(std::locale(std::locale::classic(), new Grouping));
    expectKind<ISCSIEPFileTBL>(
        EPFileBuilder::table().set(epbuilder::tbl::totalCount, 0xffffffffffffffff), "1", "10111213-1415-1617-1819-1a1b1c1d1e1f",
        "================ HEAD[1] ================\nchecksum:\t\t0xa1\nextent size:\t\t1048576\nentry size:\t\t16\ntotal count:\t\t18446744073709551615\n", "ISCSIEPFileTBL.cpp:41");
    expectKind<ISCSIEPFileFRI>(
        EPFileBuilder::freeIndex().set(epbuilder::head0::type, 0xffffffff), "4294967295", "20212223-2425-2627-2829-2a2b2c2d2e2f",
        "================ HEAD[1] ================\nchecksum:\t\t0xb1\nentry size:\t\t8\ntotal group count:\t0x100\n"
        "================ VAR[0]  ================\nchecksum:\t\t0xb2\ntotal free count:\t0x100000001\nindex head:\t\t77\n", "ISCSIEPFileFRI.cpp:45");
    expectKind<ISCSIEPFileDAT>(EPFileBuilder::data(), "3", "30313233-3435-3637-3839-3a3b3c3d3e3f",
        "================ HEAD[1] ================\nchecksum:\t\t0xc1\nserial number:\t\t5\n", "ISCSIEPFileDAT.cpp:38");
    expectKind<ISCSIEPFileMAP>(EPFileBuilder::map(), "4", "40414243-4445-4647-4849-4a4b4c4d4e4f",
        "================ HEAD[1] ================\nchecksum:\t\t0xd1\nattribute:\t\t0x3f\nlogic block size:\t512\ntotal count:\t\t4096\nparent UUID:\t\t50515253-5455-5657-5859-5a5b5c5d5e5f\n"
        "parent total count:\t2048\n================ VAR[0]  ================\nchecksum:\t\t0xd2\nmapped count:\t\t3000\n"
        "================ VAR[1]  ================\nchecksum:\t\t0xd3\nseg0 checksum:\t\t0xd4\nseg0 pool count:\t2\n"
        "session UUID:\t\t60616263-6465-6667-6869-6a6b6c6d6e6f\npromote time:\t\tSun Sep 13 12:27:40 UTC 2020\n"
        "================ VAR[2]  ================\nchecksum:\t\t0xd5\nsync count:\t\t1000\nchild attribute:\t0x1c\n"
        "track UUID:\t\t70717273-7475-7677-7879-7a7b7c7d7e7f\nprevious track UUID:\t80818283-8485-8687-8889-8a8b8c8d8e8f\n"
        "current track UUID:\t90919293-9495-9697-9899-9a9b9c9d9e9f\n================ SEG[0]  ================\n"
        "pool #1: a0a1a2a3-a4a5-a6a7-a8a9-aaabacadaeaf\npool #2: b0b1b2b3-b4b5-b6b7-b8b9-babbbcbdbebf\n", "ISCSIEPFileMAP.cpp:63");
    expectKind<ISCSIEPFileJNL>(EPFileBuilder::journal(), "5", "c0c1c2c3-c4c5-c6c7-c8c9-cacbcccdcecf",
        "================ HEAD[1] ================\nchecksum:\t\t0xe1\ntotal count:\t\t65536\n"
        "================ VAR[0]  ================\nchecksum:\t\t0xe2\nshutdown tag:\t\t0x5afe\nsync count:\t\t12\n"
        "================ VAR[1]  ================\nchecksum:\t\t0xe3\nlast trans ID:\t\t4711\nlast record start:\t4294967296\n"
        "last flush errno:\t4294967291\nlast recovery error:\t0\nempty record start:\t8192\n", "ISCSIEPFileJNL.cpp:55");
    std::locale::global(before);
}

TEST(EPFile, AFreshObjectShowsZeros) {
    EXPECT_EQ(
        "================ HEAD[0] ================\nchecksum:\t\t0x0\nversion:\t\t0\nmagic code:\t\t0x0\n"
        "type:\t\t\t0\nUUID:\t\t\t\ndata start offset:\t0x0\ncreate time:\t\tThu Jan 01 00:00:00 UTC 1970\n"
        "================ HEAD[1] ================\nchecksum:\t\t0x0\nserial number:\t\t0\n", ISCSIEPFileDAT().toString());
}
// clang-format on

TEST(EPFile, AnObjectKeepsItsSnapshotUntilReadAnew) {
    const TempDir folder;
    ISCSIEPFileTBL file(folder.write("file", EPFileBuilder::table()));
    EXPECT_EQ(0, file.parseFile());
    folder.write("file", EPFileBuilder::table().set(epbuilder::tbl::entrySize, 32).resize(1000));
    EXPECT_EQ(0, file.parseFile());
    EXPECT_EQ(18990039, file.readHeader());
    EXPECT_EQ(16U, file.entrySize);
    folder.write("file", EPFileBuilder::table().set(epbuilder::tbl::entrySize, 33).set(epbuilder::head0::type, 0));
    EXPECT_EQ(0, file.readHeader());
    EXPECT_EQ(0, file.parseFile());
    EXPECT_EQ(33U, file.entrySize);
    std::filesystem::remove(file.path);
    EXPECT_EQ(18990038, file.parseFile());  // type 0 is read at each parse
    ISCSIEPFileJNL zeros("/dev/zero");
    EXPECT_EQ(0, zeros.parseFile());
    EXPECT_EQ("00000000-0000-0000-0000-000000000000", zeros.head0UUID);
    takeLog();
}

TEST(EPFile, PoolsAreReadAsFarAsTheBlockGoes) {
    const TempDir folder;
    for (const unsigned int stored : {0U, 3U, 1024U, 1025U, 4294967295U}) {
        EPFileBuilder builder = EPFileBuilder::map().set(epbuilder::map::seg0PoolCount, stored);
        ISCSIEPFileMAP file(folder.write("map", builder.set(epbuilder::map::poolUUID(1023), 0xe0)));
        EXPECT_EQ(0, file.parseFile());
        EXPECT_EQ(stored, file.seg0PoolCount);
        const std::string end = stored == 0   ? "================ SEG[0]  ================\n"
                                : stored == 3 ? "\npool #3: 00000000-0000-0000-0000-000000000000\n"
                                              : "\npool #1024: e0e1e2e3-e4e5-e6e7-e8e9-eaebecedeeef\n";
        const std::string dump = file.toString();
        EXPECT_EQ(dump.size() - end.size(), dump.rfind(end)) << dump;
        const std::size_t count = file.poolUUIDs.size();
        EXPECT_EQ(0, file.parseFile());
        EXPECT_EQ(2 * count, file.poolUUIDs.size());
    }
}

TEST(EPFile, DumpsMayBeMadeOnSeveralThreads) {
    const TempDir folder;
    const auto dump = [path = folder.write("map", EPFileBuilder::map())] {
        ISCSIEPFileMAP file(path);
        std::string text;
        for (int i = 0; i < 50 && file.parseFile() == 0; ++i) text = file.ISCSIEPFile::toString();
        return text;
    };
    std::vector<std::future<std::string>> dumps(4);
    for (auto& made : dumps) made = std::async(std::launch::async, dump);
    for (auto& made : dumps) EXPECT_EQ(dump(), made.get());
}

TEST(EPFile, SlotsAndMembersStandInTheDocumentedOrder) {
    std::string (ISCSIEPFileMAP::*const operation)() const = &ISCSIEPFileMAP::toString;
    std::size_t word = 0;  // of a virtual operation: its slot, in bytes; on x86 plus 1
    std::memcpy(&word, &operation, sizeof word);
    EXPECT_EQ(2U, word / sizeof(void*));
    const ISCSIEPFileMAP m;
    const void* const members[] = {
        &m.path,       &m.headerBlock,  &m.head0Checksum,        &m.head0Version,    &m.head0MagicCode,
        &m.head0Type,  &m.head0UUID,    &m.head0DataStartOffset, &m.head0CreateTime, &m.attribute,
        &m.parentUUID, &m.var0Checksum, &m.sessionUUID,          &m.syncCount,       &m.poolUUIDs};
    EXPECT_TRUE(std::is_sorted(std::begin(members), std::end(members)));
}
