// Header blocks of all kinds: what is decoded and shown, and how reading them fails.
#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileFRI.h>
#include <ISCSIEPFileJNL.h>
#include <ISCSIEPFileMAP.h>
#include <ISCSIEPFileTBL.h>

#include <cstring>
#include <filesystem>
#include <locale>
#include <memory>
#include <thread>

#include "Support.h"

using namespace ISCSI::TOOL;
using epsample::EPFileBuilder;

namespace {

/// One kind of EP file as the tests drive it.
struct Kind {
    EPFileBuilder builder;
    std::string failure;  ///< the class's own line when HEAD[0] cannot be had
    std::string type, uuid, sections;
    std::unique_ptr<ISCSIEPFile> (*make)(const std::string& path);
    int (*parse)(ISCSIEPFile& file);
};

template <typename File>
Kind kind(const EPFileBuilder& builder, const std::string& source, const char* type, const char* uuid,
          const char* sections) {
    return {builder,
            source + ":parseFile Failed to get parse HEAD[0].",
            type,
            uuid,
            sections,
            [](const std::string& path) -> std::unique_ptr<ISCSIEPFile> { return std::make_unique<File>(path); },
            [](ISCSIEPFile& file) { return dynamic_cast<File&>(file).parseFile(); }};
}

// clang-format off
std::vector<Kind> allKinds() {
    return {
        kind<ISCSIEPFileTBL>(
            EPFileBuilder::table().set(epsample::tbl::totalCount, 0xffffffffffffffff), "ISCSIEPFileTBL.cpp:41", "1",
            "10111213-1415-1617-1819-1a1b1c1d1e1f",
            "================ HEAD[1] ================\nchecksum:\t\t0xa1\n"
            "extent size:\t\t1048576\nentry size:\t\t16\ntotal count:\t\t18446744073709551615\n"),
        kind<ISCSIEPFileFRI>(
            EPFileBuilder::freeIndex().set(epsample::head0::type, 0xffffffff), "ISCSIEPFileFRI.cpp:45", "4294967295",
            "20212223-2425-2627-2829-2a2b2c2d2e2f",
            "================ HEAD[1] ================\nchecksum:\t\t0xb1\n"
            "entry size:\t\t8\ntotal group count:\t0x100\n"
            "================ VAR[0]  ================\nchecksum:\t\t0xb2\n"
            "total free count:\t0x100000001\nindex head:\t\t77\n"),
        kind<ISCSIEPFileDAT>(
            EPFileBuilder::data(), "ISCSIEPFileDAT.cpp:38", "3", "30313233-3435-3637-3839-3a3b3c3d3e3f",
            "================ HEAD[1] ================\nchecksum:\t\t0xc1\nserial number:\t\t5\n"),
        kind<ISCSIEPFileMAP>(
            EPFileBuilder::map(), "ISCSIEPFileMAP.cpp:63", "4", "40414243-4445-4647-4849-4a4b4c4d4e4f",
            "================ HEAD[1] ================\nchecksum:\t\t0xd1\n"
            "attribute:\t\t0x3f\nlogic block size:\t512\ntotal count:\t\t4096\n"
            "parent UUID:\t\t50515253-5455-5657-5859-5a5b5c5d5e5f\nparent total count:\t2048\n"
            "================ VAR[0]  ================\nchecksum:\t\t0xd2\nmapped count:\t\t3000\n"
            "================ VAR[1]  ================\nchecksum:\t\t0xd3\n"
            "seg0 checksum:\t\t0xd4\nseg0 pool count:\t2\n"
            "session UUID:\t\t60616263-6465-6667-6869-6a6b6c6d6e6f\npromote time:\t\tSun Sep 13 12:27:40 UTC 2020\n"
            "================ VAR[2]  ================\nchecksum:\t\t0xd5\n"
            "sync count:\t\t1000\nchild attribute:\t0x1c\n"
            "track UUID:\t\t70717273-7475-7677-7879-7a7b7c7d7e7f\n"
            "previous track UUID:\t80818283-8485-8687-8889-8a8b8c8d8e8f\n"
            "current track UUID:\t90919293-9495-9697-9899-9a9b9c9d9e9f\n"
            "================ SEG[0]  ================\n"
            "pool #1: a0a1a2a3-a4a5-a6a7-a8a9-aaabacadaeaf\npool #2: b0b1b2b3-b4b5-b6b7-b8b9-babbbcbdbebf\n"),
        kind<ISCSIEPFileJNL>(
            EPFileBuilder::journal(), "ISCSIEPFileJNL.cpp:55", "5", "c0c1c2c3-c4c5-c6c7-c8c9-cacbcccdcecf",
            "================ HEAD[1] ================\nchecksum:\t\t0xe1\ntotal count:\t\t65536\n"
            "================ VAR[0]  ================\nchecksum:\t\t0xe2\n"
            "shutdown tag:\t\t0x5afe\nsync count:\t\t12\n"
            "================ VAR[1]  ================\nchecksum:\t\t0xe3\n"
            "last trans ID:\t\t4711\nlast record start:\t4294967296\nlast flush errno:\t4294967291\n"
            "last recovery error:\t0\nempty record start:\t8192\n"),
    };
}
// clang-format on

std::string head0Dump(const std::string& type, const std::string& uuid) {
    return "================ HEAD[0] ================\nchecksum:\t\t0xa1b2c3d\nversion:\t\t2\n"
           "magic code:\t\t0x1122334455667788\ntype:\t\t\t" +
           type + "\nUUID:\t\t\t" + uuid +
           "\ndata start offset:\t0x6000\ncreate time:\t\tSun Sep 13 12:26:40 UTC 2020\n";
}

/// A locale that groups digits, as a caller may have made global.
struct Grouping : std::numpunct<char> {
    char do_thousands_sep() const override { return '.'; }
    std::string do_grouping() const override { return "\1"; }
};

}  // namespace

TEST(EPFile, EveryKindIsDecodedAndShownWhateverTheGlobalLocale) {
    const TempDir folder;
    const std::locale before = std::locale::global(std::locale(std::locale::classic(), new Grouping));
    for (const Kind& kind : allKinds()) {
        const auto file = kind.make(folder.write("file", kind.builder));
        EXPECT_EQ(0, kind.parse(*file));
        EXPECT_EQ(head0Dump(kind.type, kind.uuid) + kind.sections, file->toString());
        EXPECT_EQ(head0Dump(kind.type, kind.uuid), file->ISCSIEPFile::toString());
    }
    std::locale::global(before);
    EXPECT_TRUE(takeLog().empty());
}

TEST(EPFile, AFreshObjectShowsZeros) {
    EXPECT_EQ(
        "================ HEAD[0] ================\nchecksum:\t\t0x0\nversion:\t\t0\nmagic code:\t\t0x0\n"
        "type:\t\t\t0\nUUID:\t\t\t\ndata start offset:\t0x0\ncreate time:\t\tThu Jan 01 00:00:00 UTC 1970\n"
        "================ HEAD[1] ================\nchecksum:\t\t0x0\nattribute:\t\t0x0\nlogic block size:\t0\n"
        "total count:\t\t0\nparent UUID:\t\t\nparent total count:\t0\n"
        "================ VAR[0]  ================\nchecksum:\t\t0x0\nmapped count:\t\t0\n"
        "================ VAR[1]  ================\nchecksum:\t\t0x0\nseg0 checksum:\t\t0x0\nseg0 pool count:\t0\n"
        "session UUID:\t\t\npromote time:\t\tThu Jan 01 00:00:00 UTC 1970\n"
        "================ VAR[2]  ================\nchecksum:\t\t0x0\nsync count:\t\t0\nchild attribute:\t0x0\n"
        "track UUID:\t\t\nprevious track UUID:\t\ncurrent track UUID:\t\n"
        "================ SEG[0]  ================\n",
        ISCSIEPFileMAP().toString());
}

TEST(EPFile, WhatCannotBeReadFailsWithAChainOfLinesAndChangesNothing) {
    const TempDir folder;
    const std::string head0 = "ISCSIEPFile.cpp:59:parseHead0 Failed to read header.";
    for (const Kind& kind : allKinds()) {
        const auto expectFailure = [&](const std::string& path, int code, const std::string& line) {
            const auto file = kind.make(path);
            const std::string fresh = file->toString();
            EXPECT_EQ(code, kind.parse(*file)) << path;
            EXPECT_EQ(chain(path, {line, head0, kind.failure}), takeLog());
            EXPECT_EQ(fresh, file->toString());
        };
        for (const std::string& path : {std::string(), folder.path("no%s%nfile")}) {
            expectFailure(path, 18990038, "ISCSIEPFile.cpp:37:readHeader Failed to open file.");
        }
        const std::string unreadable = "ISCSIEPFile.cpp:42:readHeader Failed to read file.";
        expectFailure(folder.path(""), 18990039, unreadable);
        expectFailure("/dev/null", 18990039, unreadable);
        const std::string path = folder.write("file", kind.builder);
        for (std::uintmax_t size = 24576; size-- > 0;) {
            std::filesystem::resize_file(path, size);
            if (size % 1000 == 575 || size < 10) expectFailure(path, 18990039, unreadable);
            ASSERT_EQ(18990039, ISCSIEPFile(path).readHeader()) << size;
            takeLog();
        }
    }
}

TEST(EPFile, AnObjectKeepsItsSnapshotUntilReadAnew) {
    const TempDir folder;
    const std::string path = folder.write("file", EPFileBuilder::table());
    ISCSIEPFileTBL file(path);
    EXPECT_EQ(0, file.parseFile());
    const std::string before = file.toString();
    std::filesystem::remove(path);
    EXPECT_EQ(0, file.parseFile());
    EXPECT_EQ(before, file.toString());
    folder.write("file", EPFileBuilder::table().set(epsample::tbl::entrySize, 32).resize(1000));
    EXPECT_EQ(18990039, file.readHeader());
    EXPECT_EQ(before, file.toString());
    folder.write("file", EPFileBuilder::table().set(epsample::tbl::entrySize, 32));
    EXPECT_EQ(0, file.readHeader());
    EXPECT_EQ(16U, file.entrySize);
    EXPECT_EQ(0, file.parseFile());
    EXPECT_EQ(32U, file.entrySize);
    takeLog();
}

TEST(EPFile, TypeZeroIsReadAtEachParse) {
    const TempDir folder;
    const std::string path = folder.write("file", EPFileBuilder::journal().set(epsample::head0::type, 0));
    ISCSIEPFileJNL file(path);
    EXPECT_EQ(0, file.parseFile());
    EXPECT_EQ(12U, file.syncCount);
    std::filesystem::remove(path);
    EXPECT_EQ(18990038, file.parseFile());
    EXPECT_EQ(12U, file.syncCount);
    takeLog();
    ISCSIEPFileJNL zeros("/dev/zero");
    EXPECT_EQ(0, zeros.parseFile());
    EXPECT_EQ("00000000-0000-0000-0000-000000000000", zeros.head0UUID);
}

TEST(EPFile, PoolsAreReadAsFarAsTheBlockGoes) {
    const TempDir folder;
    struct Case {
        std::uint64_t stored;
        std::size_t read;
    };
    for (const Case& c : {Case{0, 0}, Case{3, 3}, Case{1024, 1024}, Case{1025, 1024}, Case{4294967295, 1024}}) {
        ISCSIEPFileMAP file(folder.write(
            "map",
            EPFileBuilder::map().set(epsample::map::seg0PoolCount, c.stored).set(epsample::map::poolUUID(1023), 0xe0)));
        EXPECT_EQ(0, file.parseFile());
        EXPECT_EQ(c.stored, file.seg0PoolCount);
        ASSERT_EQ(c.read, file.poolUUIDs.size());
        const std::string dump = file.toString();
        const std::string last = c.read < 1024 ? "pool #3: 00000000-0000-0000-0000-000000000000\n"
                                               : "pool #1024: e0e1e2e3-e4e5-e6e7-e8e9-eaebecedeeef\n";
        const std::string end = c.read == 0 ? "================ SEG[0]  ================\n" : last;
        EXPECT_EQ(dump.size() - end.size(), dump.rfind(end));
        EXPECT_EQ(0, file.parseFile());
        EXPECT_EQ(2 * c.read, file.poolUUIDs.size());
    }
}

TEST(EPFile, DumpsMayBeMadeOnSeveralThreads) {
    const TempDir folder;
    const std::string path = folder.write("map", EPFileBuilder::map());
    std::vector<std::string> dumps(4);
    std::vector<std::thread> threads;
    for (std::string& dump : dumps) {
        threads.emplace_back([&path, &dump] {
            ISCSIEPFileMAP file(path);
            for (int i = 0; i < 50 && file.parseHead0() == 0; ++i)
                dump = file.toString();
        });
    }
    for (std::thread& thread : threads)
        thread.join();
    EXPECT_NE("", dumps[0]);
    for (const std::string& dump : dumps)
        EXPECT_EQ(dumps[0], dump);
}

namespace {

/// The slot of a virtual operation in the class's table, counted from 0.
template <typename Class>
std::size_t slotOf(std::string (Class::*operation)() const) {
    std::size_t word = 0;
    std::memcpy(&word, &operation, sizeof word);
    return word / sizeof(void*);  // x86 marks a virtual operation by adding 1, ARM elsewhere
}

template <typename... Members>
bool ascending(const Members&... members) {
    const void* addresses[] = {&members...};
    return std::is_sorted(std::begin(addresses), std::end(addresses));
}

}  // namespace

TEST(EPFile, SlotsAndMembersStandInTheDocumentedOrder) {
    EXPECT_EQ(2U, slotOf(&ISCSIEPFile::toString));
    EXPECT_EQ(2U, slotOf(&ISCSIEPFileMAP::toString));
    const ISCSIEPFileMAP m;
    EXPECT_TRUE(ascending(m.path, m.headerBlock, m.head0Checksum, m.head0Version, m.head0MagicCode, m.head0Type,
                          m.head0UUID, m.head0DataStartOffset, m.head0CreateTime, m.head1Checksum, m.attribute,
                          m.logicBlockSize, m.totalCount, m.parentUUID, m.parentTotalCount, m.var0Checksum,
                          m.mappedCount, m.var1Checksum, m.seg0Checksum, m.seg0PoolCount, m.sessionUUID, m.promoteTime,
                          m.var2Checksum, m.syncCount, m.childAttribute, m.trackUUID, m.previousTrackUUID,
                          m.currentTrackUUID, m.poolUUIDs));
}
