// The built program on a sample store: what it prints, says and exits with.
#include <sys/wait.h>

#include <cstdlib>
#include <filesystem>
#include <sstream>

#include "Support.h"

namespace {

struct Case {
    std::string command;  ///< for the shell; $E runs epinspect and $P epsample, $S is the store, $M its map file, $T
                          ///< the test's folder
    int status;
    std::string output;   ///< standard output; after "..." only its end, before "..." only its start
    std::string message;  ///< a part of standard error, "" for none at all
};

bool matches(const std::string& text, const std::string& pattern) {
    const auto dots = pattern.find("...");
    if (dots == std::string::npos) return text == pattern;
    const std::string end = pattern.substr(dots + 3);
    return text.compare(0, dots, pattern, 0, dots) == 0 && text.size() >= end.size() &&
           text.compare(text.size() - end.size(), end.size(), end) == 0;
}

}  // namespace

TEST(Epinspect, PrintsSaysAndExitsAsPromised) {
    const TempDir folder;
    folder.write("empty", epbuilder::EPFileBuilder::table().resize(0));
    folder.write("plain", epbuilder::EPFileBuilder::table());
    folder.write("mapped", epbuilder::EPFileBuilder::map().set(epbuilder::map::seg0PoolCount, 0));
    folder.write("five",
                 epbuilder::EPFileBuilder::map().entry(0, 0x9000000000000000).entry(1, 0x9010000000000001).entry(4, 1));
    folder.write("short", epbuilder::EPFileBuilder::map().resize(24575));
    std::ostringstream setup;
    setup << "E='" EPINSPECT_COMMAND "'; P='" EPSAMPLE_COMMAND "'; T=" << folder.path("")
          << "; S=$T/store; M=$S/volume1/@iSCSI/LUN/"
          << "BLUN6f1c1d0a-58d3-4e0f-9b51-2f7a9c5e0d11lun1_00000; D=$S/volume1/@iSCSI/EP/EP_DAT_00001; cd $T; ";
    ASSERT_EQ(0, std::system((setup.str() + "$P $S").c_str()));
    const std::string map = "/volume1/@iSCSI/LUN/BLUN6f1c1d0a-58d3-4e0f-9b51-2f7a9c5e0d11lun1_00000\n";
    const std::string hole = "extentAddress\":0,\"poolNumber\":0,\"mapped\":false,\"vpushed\":false,\"vpulled\":false,";
    // clang-format off
    const Case cases[] = {
        // kinds by name, by type, by choice; several files with a bad one in the middle
        {"$E dump $S/var/db/iscsi/EP_JNL", 0, "...empty record start:\t6149198378188823388\n", ""}, {"$E dump $D", 0, "...serial number:\t\t1\n", ""},
        {"$E dump mapped", 0, "...================ SEG[0]  ================\n", ""}, {"$E dump plain", 0, "...create time:\t\tSun Sep 13 12:26:40 UTC 2020\n", "plain: neither name nor type tells its kind"},
        {"$E dump --as fri plain", 0, "...index head:\t\t0\n", ""},
        {"$E --root $S dump /volume1/@iSCSI/EP/EP_TBL $S/none $T volume1/@iSCSI/EP/EP_FRI", 1, "/volume1/@iSCSI/EP/EP_TBL:\n...index head:\t\t14830019118758024148\n", "store/none: cannot be opened: No such file or directory (EP_ERR_OPEN_FAILED, 18990038)\nepinspect: "},
        {"$E dump --json --as head plain", 0, "{\"kind\":\"head\",\"file\":\"plain\",\"head0Checksum\":\"0xa1b2c3d\",\"head0Version\":33752069,\"head0MagicCode\":\"0x1122334455667788\",\"head0Type\":1,\"head0UUID\":\"10111213-1415-1617-1819-1a1b1c1d1e1f\",\"head0DataStartOffset\":\"0x6000\",\"head0CreateTime\":1600000000}\n", ""},
        {"$E dump --json $M", 0, "...\"poolUUIDs\":[\"a0a1a2a3-a4a5-a6a7-a8a9-aaabacadaeaf\",\"b0b1b2b3-b4b5-b6b7-b8b9-babbbcbdbebf\"]}\n", ""},
        {"$E dump short -v", 1, "", "epinspect: iSCSI:ISCSIEPFile.cpp:42:readHeader Failed to read file. path: short\n"},
        {"$E dump /dev/zero", 1, "", "epinspect: /dev/zero: cannot be opened: neither a regular file nor a block device (EP_ERR_OPEN_FAILED, 18990038)\n"}, {"mkfifo fifo; $E dump fifo", 1, "", "neither a regular file"},
        {"$E dump \"$(printf 'a\\033[1m\\nb')\"", 1, "", "epinspect: a\\x1b[1m\\x0ab: cannot be opened: No such"},
        {"for f in none $T empty; do for c in dump 'entry 0' map 'extent 0 --extent-size 1'; do set -- $c; a=$1; shift; $E $a $f \"$@\" 2>/dev/null; printf $?; done; done", 0, "111111111111", ""},
        {"$E dump --as nonsense plain", 2, "", "nonsense"}, {"$E dump", 2, "", "FILE"}, {"$E dump --bogus x", 2, "", "--bogus"},
        // entries
        {"$E entry $M 512 0x190", 0, "512: pool number: 16 ,extent address: 4194816 ,mapped: true ,vpushed: false ,vpulled: false ,synced: false\n400: pool number: 0 ,...false\n", ""},
        {"$E entry --json $M 4094-4095", 0, "{\"kind\":\"entry\",\"file\":\"...\",\"index\":4095,\"entryOffset\":57336,\"" + hole + "\"synced\":false}\n", ""},
        {"$E entry $M 4095-9999 0", 1, "4095: pool...0: pool number: 0 ,extent address: 0 ,mapped: true ,vpushed: false ,vpulled: false ,synced: true\n", "entry 4096: beyond the end, the file holds 0-4095 (EP_ERR_READ_FAILED, 18990039)\n"},
        {"$E entry $D 0", 1, "", "wrong type of EP file (EP_ERR_WRONG_FILE_TYPE, 18990400)"},
        {"$E entry $M -1", 2, "", "'-1': not a number"}, {"$E entry $M 1x", 2, "", "not a number"}, {"$E entry $M 3-2", 2, "", "backwards"},
        {"$E entry $M 18446744073709551616", 2, "", "out of range"}, {"$E entry $M ' 1'", 2, "", "not a number"}, {"$E entry $M", 2, "", "INDEX"},
        // maps
        {"$E map five", 0, "0: mapped synced, pool 0, extent 0\n1: mapped synced, pool 16, extent 1\n2-3: hole\n4: unmapped, pool 0, extent 1\n5 entries in 4 runs: 2 mapped, 1 unmapped, 2 holes; 0 vpushed, 0 vpulled, 2 synced\n", ""},
        {"$E map five --first 1 --count 2 --json", 0, "{\"kind\":\"run\",\"file\":\"five\",\"first\":1,\"count\":1,\"entryOffset\":24584,\"extentAddress\":1,\"poolNumber\":16,\"mapped\":true,\"vpushed\":false,\"vpulled\":false,\"synced\":true}\n{\"kind\":\"run\",\"file\":\"five\",\"first\":2,\"count\":1,\"entryOffset\":24592,\"hole\":true}\n{\"kind\":\"summary\",\"file\":\"five\",\"summary\":true,\"entries\":2,\"mapped\":1,\"unmapped\":0,\"vpushed\":0,\"vpulled\":0,\"synced\":1,\"holes\":1,\"runs\":2}\n", ""},
        {"$E map five --chart", 0, "0 |##...|\nOne cell: 1 entry\nMapped: . none  - <1/3  + <2/3  * most  # all\n5 entries in 4 runs: 2 mapped, 1 unmapped, 2 holes; 0 vpushed, 0 vpulled, 2\nsynced\n", ""},
        {"$E map $M --chart", 0, "   0 |####...\n4088 |++|\nOne cell: 4 entries\nMapped: . none  - <1/3  + <2/3  * most  # all\n4096 entries in 402 runs: 2256 mapped, 0 unmapped, 1840 holes; 96 vpushed, 48\nvpulled, 1200 synced\n", ""},
        {"$E map mapped", 0, "0 entries in 0 runs: 0 mapped, 0 unmapped, 0 holes; 0 vpushed, 0 vpulled, 0 synced\n", ""},
        {"$E map $M --first 4096", 1, "", "entry 4096: beyond the end"}, {"$E map $S/volume1/@iSCSI/EP/EP_TBL", 1, "", "WRONG_FILE_TYPE"},
        {"$E map $M --chart --json", 2, "", "excludes"}, {"$E map $M --count x", 2, "", "not a number"},
        // a big map, walked in blocks that end with the file
        {"$P big --map-entries 81920; $E map big/volume1/@iSCSI/LUN/* | tail -n 1", 0, "81920 entries in 8040 runs: 45120 mapped, 0 unmapped, 36800 holes; 1920 vpushed, 960 vpulled, 24000 synced\n", ""},
        // extents
        {"$E extent $D 5200 --extent-size 1M | cut -c 1-40", 0, "66696c65203120657874656e7420353230300a2e\n", ""},
        {"$E extent $D 0x14500 --extent-size 64K --raw | sed -n 1p", 0, "file 1 extent 5200\n", ""},
        {"$E extent $D 6144 --extent-size 1M", 1, "", "extent 6144: beyond the end"}, {"$E extent $D 0 --extent-size 0", 1, "", "EP_ERR_BAD_EXTENT_SIZE, 18990507"},
        {"$E extent $D 0", 2, "", "--extent-size"}, {"$E extent $D 0 --extent-size 4G", 2, "", "out of range"}, {"$E extent $D 0 --extent-size 1T", 2, "", "out of range"},
        // LUNs and paths
        {"$E lun 1 --root $S", 0, "lid: 1 ,extent_size: 1048576 (1MB) ,size: 4294967296 (4GB) ,restore time: Sun Sep 13 12:28:40 UTC 2020 ,type: BLUN ,uuid: 6f1c1d0a-58d3-4e0f-9b51-2f7a9c5e0d11 ,rootpath: /volume1 ,name: lun1\n" + map, ""},
        {"KELPISCSIEP_LUNS=$S/var/db/iscsi/luns.json $E lun --json 2 9", 1, "{\"kind\":\"lun\",\"file\":\"/volume2/@iSCSI/LUN/THIN0b9d2f64-7c1e-4a55-8a3b-90c4d7e6f522lun2_00000\",\"lid\":2,\"extentSize\":65536,\"size\":16777216,\"restoreTime\":0,\"type\":7,\"uuid\":\"0b9d2f64-7c1e-4a55-8a3b-90c4d7e6f522\",\"rootPath\":\"/volume2\",\"name\":\"lun2\",\"typeName\":\"THIN\",\"missing\":true}\n{\"kind\":\"error\"...\n", "epinspect: LUN 9: configuration cannot be loaded: No such LUN (code 9001)\n"},
        {"$E lun 4294967296", 2, "", "out of range"}, {"$E --root $S path map 1", 0, map, ""}, {"$E path map 1 --root $T", 1, "", "LUN 1: "},
        {"$E --root $S/ path tbl $M", 0, "/volume1/@iSCSI/EP/EP_TBL\n", ""}, {"$E path fri /volume2/x", 0, "/volume2/@iSCSI/EP/EP_FRI\n", ""}, {"$E path jnl x", 0, "/var/db/iscsi/EP_JNL\n", ""},
        {"$E path dat /volume3/x --extent-size 1M --extent-address 4194304", 0, "/volume3/@iSCSI/EP/EP_DAT_00001\n", ""}, {"$E path tbl $M", 1, "", "path names no volume (EP_ERR_NO_PATH, 18990401)"},
        {"$E path", 2, "", "subcommand"}, {"$E", 2, "", "subcommand"}, {"$E nonsense", 2, "", "nonsense"},
        {"$E --version", 0, "epinspect 1.0.0\n", ""}, {"$E --help", 0, "Shows what...", ""}, {"$E map --help", 0, "Show all...", ""},
        {"$E dump $M >/dev/full", 1, "", "epinspect: standard output: No space left on device\n"}, {"$E --help >/dev/full", 1, "", "standard output"},
        {"($E map big/volume1/@iSCSI/LUN/*; echo $? >status) 2>said | true; cat said status", 0, "1\n", ""},
    };
    // clang-format on
    const auto contentOf = [&folder](const char* name) {
        std::ostringstream text;
        text << std::ifstream(folder.path(name), std::ios::binary).rdbuf();
        return text.str();
    };
    for (const Case& c : cases) {
        const std::string redirected = "{ " + c.command + "; } >" + folder.path("out") + " 2>" + folder.path("err");
        const int status = std::system((setup.str() + redirected).c_str());
        EXPECT_EQ(c.status, WEXITSTATUS(status)) << c.command;
        const std::string output = contentOf("out");
        EXPECT_TRUE(matches(output, c.output)) << c.command << '\n' << output.substr(0, 2000);
        const std::string message = contentOf("err");
        const bool asPromised = c.message.empty() ? message.empty() : message.find(c.message) != std::string::npos;
        EXPECT_TRUE(asPromised) << c.command << '\n' << message;
    }
}
