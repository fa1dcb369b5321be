// The sample maker: its store fits together whatever its size, and nothing that is there is touched.
#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileMAP.h>
#include <ISCSIEPFileTBL.h>
#include <ISCSILUNConfInfo.h>

#include "Support.h"

using namespace ISCSI::TOOL;

/// Expects that all there is of a LUN fits together: its configuration, its map of `count` entries, table, data files.
static void expectConsistent(const std::string& root, unsigned int lid, std::uint64_t count) {
    setenv("KELPISCSIEP_LUNS", (root + "/var/db/iscsi/luns.json").c_str(), 1);
    ISCSILUNConfInfo lun(lid);
    ASSERT_EQ(0, lun.loadFromConfig());
    std::string path;
    ASSERT_EQ(0, ISCSIEPFile("").getMAPFilePath(lun.lid, path));
    ISCSIEPFileMAP map(root + path);
    ISCSIEPFileTBL table(root + lun.rootPath + "/@iSCSI/EP/EP_TBL");
    ASSERT_EQ(0, map.parseFile() + table.parseFile());
    EXPECT_EQ(std::pair(lun.extentSize, lun.size), std::pair(table.extentSize, map.totalCount * lun.extentSize));
    ASSERT_TRUE(map.totalCount == count && std::filesystem::file_size(map.path) == 24576 + 8 * count) << map.totalCount;
    std::uint64_t mapped = 0, synced = 0;
    std::vector<bool> used;  // by extent address
    std::vector<ISCSIEPMapEntryInfo> entries;
    for (std::uint64_t index = 0; index < map.totalCount; index += entries.size()) {
        ASSERT_EQ(0, map.getMapEntries(index, 65536, entries));
        for (const ISCSIEPMapEntryInfo& entry : entries) {
            const auto address = static_cast<std::size_t>(entry.extentAddress);
            ASSERT_EQ(0U, entry.poolNumber % (entry.mapped ? 16 : 0x1000)) << entry.toString();
            ASSERT_TRUE(entry.mapped || (address == 0 && !entry.synced && !entry.vpushed && !entry.vpulled));
            if (!entry.mapped) continue;
            ++mapped;
            if (entry.synced) ++synced;
            used.resize(std::max(used.size(), address + 1));
            ASSERT_FALSE(used[address]) << entry.toString();
            used[address] = true;
        }
    }
    EXPECT_TRUE(map.mappedCount == mapped && map.syncCount == synced) << mapped << ' ' << synced;
    const std::uint64_t extentsPerFile = (std::uint64_t{1} << 42U) / lun.extentSize;
    for (std::uint64_t number = 0; number * extentsPerFile < used.size(); ++number) {
        ASSERT_EQ(0, ISCSIEPFile(lun.rootPath).getDATFilePath(lun.extentSize, number * extentsPerFile, path));
        ISCSIEPFileDAT file(root + path);
        ASSERT_TRUE(file.parseFile() == 0 && file.serialNumber == number) << path;
        auto end = std::min(used.size(), static_cast<std::size_t>((number + 1) * extentsPerFile));
        while (end > number * extentsPerFile && !used[end - 1]) --end;
        EXPECT_LE(24576 + (end - number * extentsPerFile) * lun.extentSize, std::filesystem::file_size(file.path));
    }
}

TEST(Epsample, StoresFitTogetherAndNothingIsOverwritten) {
    const TempDir folder;
    // clang-format off
    const std::tuple<std::string, int, const char*> runs[] = {  // arguments, exit status, a part of the message
        {"plain", 0, ""}, {"tiny --map-entries 0X2ff", 0, ""}, {"deep/big --map-entries 4198401", 0, ""},
        {"--broken broken", 0, ""}, {"--version >said", 0, "epsample 1.0.0\n"},
        {"-h >said", 0, "Usage: epsample "}, {"--help >/dev/full", 1, "standard output"},
        {"plain", 1, "epsample: plain: not empty, and nothing is overwritten; name a new folder or an empty one\n"}, {"said", 1, "said: not a folder"}, {"said/x", 1, "said/x: Not a directory"},
        {"cut", 1, "epsample: cut: what has been written is not a whole store\n"}, {"", 2, "epsample: DIR is missing\nTry 'epsample --help'.\n"}, {"''", 2, "DIR"},
        {"a b", 2, "'b': only one DIR is possible\n"}, {"a --map-entries 1x", 2, "--map-entries: '1x' is not a number from 0 to 4294967296\n"}, {"a --broken --map-entries 3", 2, "--map-entries and --broken exclude each other"},
        {"a --map-entries 4294967297", 2, "from 0 to 4294967296"}};
    // clang-format on
    for (const auto& [arguments, status, message] : runs) {
        const std::string before = "cd '" + folder.path("") + (arguments == "cut" ? "'; ulimit -f 100; " : "'; ");
        EXPECT_EQ(status << 8, std::system((before + PROGRAMS "/epsample " + arguments + " 2>said").c_str()));
        std::ifstream stream(folder.path("said"));
        const std::string said{std::istreambuf_iterator<char>(stream), {}};
        EXPECT_TRUE(*message == '\0' ? said.empty() : said.find(message) != std::string::npos) << arguments << '\n'
                                                                                               << said;
    }
    for (const auto& [store, count] : {std::pair("plain", 4096U), {"tiny", 767U}, {"deep/big", 4198401U}})
        for (const unsigned int lid : {1U, 2U}) expectConsistent(folder.path(store), lid, lid == 1 ? count : 256);
}
