// Header blocks of all kinds: what is decoded and shown, and how reading them fails.
#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileFRI.h>
#include <ISCSIEPFileJNL.h>
#include <ISCSIEPFileMAP.h>
#include <ISCSIEPFileTBL.h>
#include <unistd.h>

#include <cerrno>
#include <cstring>
#include <future>
#include <locale>
#include <map>
#include <new>
#include <sstream>

#include "Dumps.h"
#include "Support.h"

using namespace ISCSI::TOOL;
using epbuilder::EPFileBuilder;
namespace head0 = epbuilder::head0;

namespace {

/// The dump of a new object, made from the one of a file: values are 0, in 1970 or empty, and there are no pools.
std::string emptied(const std::string& dump) {
    std::string text;
    std::istringstream lines(dump);
    for (std::string line; std::getline(lines, line);) {
        if (line.rfind("pool #", 0) == 0) continue;
        const std::size_t start = line[0] == '=' ? line.size() : line.rfind('\t') + 1;
        std::string value = line.substr(start);
        if (value.rfind("0x", 0) == 0) {
            value = "0x0";
        } else if (value.find(" UTC ") != std::string::npos) {
            value = "Thu Jan 01 00:00:00 UTC 1970";
        } else if (value.find('-') != std::string::npos) {
            value.clear();
        } else if (!value.empty()) {
            value = "0";
        }
        text += line.substr(0, start) + value + "\n";
    }
    return text;
}

/// What a new object shows, made where memory holds something else.
template <typename File>
std::string freshDump() {
    alignas(File) unsigned char memory[sizeof(File)];
    std::memset(memory, 0xaa, sizeof memory);
    auto* file = new (memory) File();
    const std::string dump = file->toString();
    file->~File();
    return dump;
}

/// One kind of file as the builder makes it: type and UUID in HEAD[0], the further sections, and the source and line of
/// the class's own message.
struct Kind {
    std::string type, uuid, sections, source;
};

/// The file is shown as promised; an unreadable one leaves the object as it was, and a chain of lines.
template <typename File>
void expectKind(const EPFileBuilder& builder, const Kind& kind) {
    const TempDir folder;
    const std::string path = folder.write("file", builder);
    File file(path);
    const std::string head0 = head0Dump(kind.type, kind.uuid, "0x6162636465666768");
    const std::string fresh = emptied(head0 + kind.sections);
    EXPECT_TRUE(fits(freshDump<File>(), fresh));
    EXPECT_EQ(0, file.parseFile());
    EXPECT_TRUE(fits(static_cast<const ISCSIEPFile&>(file).toString(), head0 + kind.sections));
    EXPECT_TRUE(fits(file.ISCSIEPFile::toString(), head0));

    const auto expectFailure = [&](const std::string& unreadable, int code, const std::string& first) {
        File other(unreadable);
        EXPECT_EQ(code, other.parseFile()) << unreadable;
        EXPECT_EQ(chain(unreadable, {first, "ISCSIEPFile.cpp:59:parseHead0 Failed to read header.",
                                     kind.source + ":parseFile Failed to get parse HEAD[0]."}),
                  takeLog());
        EXPECT_TRUE(fits(other.toString(), fresh));
    };
    expectFailure("", 18990038, "ISCSIEPFile.cpp:37:readHeader Failed to open file.");
    expectFailure(path + "no%s%n", 18990038, "ISCSIEPFile.cpp:37:readHeader Failed to open file.");
    const std::string failedRead = "ISCSIEPFile.cpp:42:readHeader Failed to read file.";
    expectFailure(folder.path(""), 18990039, failedRead);
    expectFailure("/dev/null", 18990039, failedRead);
    for (const unsigned int size : {24575U, 20000U, 4096U, 47U, 1U, 0U}) {
        std::filesystem::resize_file(path, size);
        expectFailure(path, 18990039, failedRead);
    }
}

/// A locale that groups digits, as a caller may have made global.
struct Grouping : std::numpunct<char> {
    char do_thousands_sep() const override { return '.'; }
    std::string do_grouping() const override { return "\1"; }
};

}  // namespace

TEST(EPFile, EveryKindIsDecodedAndShownWhateverTheGlobalLocale) {
    const std::locale before = std::locale::global(std::locale(std::locale::classic(), new Grouping));
    const auto valid = [](EPFileBuilder file) { return file.set(head0::dataStartOffset, 0x6162636465666768); };
    expectKind<ISCSIEPFileTBL>(valid(EPFileBuilder::table()), {"1", uuids[1], tableDump, "ISCSIEPFileTBL.cpp:41"});
    expectKind<ISCSIEPFileFRI>(valid(EPFileBuilder::freeIndex().set(head0::type, 0xffffffff)),
                               {"4294967295", uuids[2], freeIndexDump, "ISCSIEPFileFRI.cpp:45"});
    expectKind<ISCSIEPFileDAT>(valid(EPFileBuilder::data()), {"3", uuids[3], dataDump, "ISCSIEPFileDAT.cpp:38"});
    expectKind<ISCSIEPFileMAP>(valid(EPFileBuilder::map()), {"4", uuids[4], mapDump, "ISCSIEPFileMAP.cpp:63"});
    expectKind<ISCSIEPFileJNL>(valid(EPFileBuilder::journal()), {"5", uuids[5], journalDump, "ISCSIEPFileJNL.cpp:55"});
    std::locale::global(before);
}

TEST(EPFile, TheSystemsReasonIsLeftInErrno) {
    const TempDir folder;
    const std::string path = folder.write("closed", EPFileBuilder::table());
    std::filesystem::permissions(path, std::filesystem::perms::none);
    std::filesystem::create_symlink("loop", folder.path("loop"));
    const std::pair<std::string, int> reasons[] = {{folder.path("missing"), ENOENT},
                                                   {path, EACCES},
                                                   {folder.path("loop"), ELOOP},
                                                   {folder.path(""), EISDIR},
                                                   {folder.path(std::string(300, 'x')), ENAMETOOLONG},
                                                   {path + "/below", ENOTDIR},
                                                   {folder.write("short", EPFileBuilder::table().resize(24575)), 0}};
    for (const auto& [name, reason] : reasons) {
        const uid_t self = geteuid();
        EXPECT_EQ(0, seteuid(reason == EACCES && self == 0 ? 65534 : self));
        ISCSIEPFileTBL file(name);
        EXPECT_NE(0, file.parseFile()) << name;
        EXPECT_EQ(reason, errno) << name;
        EXPECT_EQ(0, seteuid(self));
    }
    std::string text;
    ISCSIEPMapEntryInfo entry;
    ISCSIEPFileMAP table(folder.write("table", EPFileBuilder::table()));
    EXPECT_EQ(0, table.parseHead0());
    errno = EDOM;
    EXPECT_EQ(18990400, table.getMapEntry(0, entry));
    EXPECT_EQ(0, errno);
    ISCSIEPFileMAP map(folder.write("map", EPFileBuilder::map()));
    EXPECT_EQ(18990039, map.getMapEntry(0, entry));
    EXPECT_EQ(0, errno);
    EXPECT_EQ(18990041, map.getMapEntry(std::uint64_t{1} << 60U, entry));
    EXPECT_EQ(EINVAL, errno);
    EXPECT_EQ(18990401, ISCSIEPFile("/volume99999999999999999999").getTBLFilePath(text));
    EXPECT_EQ(0, errno);
    takeLog();
}

TEST(EPFile, AnObjectKeepsItsSnapshotUntilReadAnew) {
    const TempDir folder;
    const auto write = [&folder](unsigned int entrySize, unsigned int type, std::uint64_t size) {
        auto table = EPFileBuilder::table().set(epbuilder::tbl::entrySize, entrySize).set(head0::type, type);
        return folder.write("file", table.resize(size));
    };
    ISCSIEPFileTBL file(write(16, 1, 24576));
    EXPECT_EQ(0, file.parseFile());
    write(32, 1, 1000);
    EXPECT_EQ(0, file.parseFile());
    EXPECT_EQ(18990039, file.readHeader());
    EXPECT_EQ(16U, file.entrySize);
    write(33, 0, 24576);
    EXPECT_EQ(0, file.readHeader());
    EXPECT_EQ(0, file.parseFile());
    const std::string before = file.toString();
    EXPECT_EQ(33U, file.entrySize);
    std::filesystem::remove(file.path);
    EXPECT_EQ(18990038, file.parseFile());  // type 0 is read at each parse
    EXPECT_TRUE(fits(file.toString(), before));
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
        for (int i = 0; i < 50 && file.parseFile() == 0; ++i) text = file.toString();
        return text;
    };
    std::vector<std::future<std::string>> dumps(4);
    for (auto& made : dumps) made = std::async(std::launch::async, dump);
    for (auto& made : dumps) EXPECT_TRUE(fits(made.get(), dump()));
}
