// epinspect dump: header blocks as text and as JSON, how the kind of a file is found, and what is doubtful about it.
#include "Dumps.h"
#include "ProgramTest.h"

namespace {

class Dump : public ProgramTest {
protected:
    Dump() {
        write("EP_TBL", EPFileBuilder::table());
        write("EP_FRI", EPFileBuilder::freeIndex());
        write("EP_JNL", EPFileBuilder::journal());
        write("EP_DAT_7", EPFileBuilder::data());
        write("@iSCSI/LUN/m", EPFileBuilder::map());
        write("early", EPFileBuilder::data().set(epbuilder::head0::dataStartOffset, 24575));
        write("late", EPFileBuilder::map().set(epbuilder::head0::dataStartOffset, 24577));
    }
};

// clang-format off
std::string text(unsigned int type, const char* sections) {
    return head0Dump(std::to_string(type), uuids[type], "0x6000") + sections;
}

std::string json(const char* kind, const char* file, unsigned int type, const char* members) {
    return std::string("{\"kind\":\"") + kind + "\",\"file\":\"" + file + "\",\"head0Checksum\":\"0xa1b2c3d\"," +
           R"("head0Version":33752069,"head0MagicCode":"0x1122334455667788","head0Type":)" + std::to_string(type) +
           R"(,"head0UUID":")" + uuids[type] + R"(","head0DataStartOffset":"0x6000","head0CreateTime":1600000000)" +
           members + "}\n";
}

const std::string noFile =
    ": cannot be opened: neither a regular file nor a block device (EP_ERR_OPEN_FAILED, 18990038)";

const std::string folder = ": cannot be opened: is a folder, not a file; --root takes the folder of a store "
                           "(EP_ERR_OPEN_FAILED, 18990038)";

const Case cases[] = {
    {"shows files of every kind and goes on after a failure", "epinspect dump EP_TBL EP_FRI gone EP_DAT_7 @iSCSI/LUN/m "
     "EP_JNL 2>&1; epinspect dump EP_TBL", 0,
     "EP_TBL:\n" + text(1, tableDump) + "EP_FRI:\n" + text(2, freeIndexDump) + says({"gone" + missing}) +
     "EP_DAT_7:\n" + text(3, dataDump) + "@iSCSI/LUN/m:\n" + text(4, mapDump) + "EP_JNL:\n" + text(5, journalDump) +
     text(1, tableDump), ""},
    {"writes files of every kind as JSON", "epinspect dump --json EP_TBL EP_FRI EP_DAT_7 @iSCSI/LUN/m EP_JNL", 0,
     json("tbl", "EP_TBL", 1, R"(,"head1Checksum":"0xa1a2a3a4","extentSize":2779162536,"entrySize":2846534572,)"
     R"("totalCount":12515133587939570612)") +
     json("fri", "EP_FRI", 2, R"(,"head1Checksum":"0xb1b2b3b4","entrySize":3048650680,)"
     R"("totalGroupCount":"0xb9babbbcbdbebfc0","var0Checksum":"0xc1c2c3c4","totalFreeCount":"0xc5c6c7c8c9cacbcc",)"
     R"("indexHead":14830019118758024148)") +
     json("dat", "EP_DAT_7", 3, R"(,"head1Checksum":"0xc1c2c3c4","serialNumber":3318138824)") +
     json("map", "@iSCSI/LUN/m", 4, R"(,"head1Checksum":"0xd1d2d3d4","attribute":"0xd5d6d7d8",)"
     R"("logicBlockSize":3654999004,"totalCount":15987461884167250916,)"
     R"("parentUUID":"50515253-5455-5657-5859-5a5b5c5d5e5f","parentTotalCount":16566183266871864300,)"
     R"("var0Checksum":"0x1122334","mappedCount":1302406798037686297,"var1Checksum":"0x21222324",)"
     R"("seg0Checksum":"0x25262728","seg0PoolCount":2,"sessionUUID":"60616263-6465-6667-6869-6a6b6c6d6e6f",)"
     R"("promoteTime":1600000060,"var2Checksum":"0x31323334","syncCount":3834312847370369852,)"
     R"("childAttribute":"0x3d3e3f40","trackUUID":"70717273-7475-7677-7879-7a7b7c7d7e7f",)"
     R"("previousTrackUUID":"80818283-8485-8687-8889-8a8b8c8d8e8f",)"
     R"("currentTrackUUID":"90919293-9495-9697-9899-9a9b9c9d9e9f",)"
     R"("poolUUIDs":["a0a1a2a3-a4a5-a6a7-a8a9-aaabacadaeaf","b0b1b2b3-b4b5-b6b7-b8b9-babbbcbdbebf"])") +
     json("jnl", "EP_JNL", 5, R"(,"head1Checksum":"0xe1e2e3e4","totalCount":16566183266871864300,)"
     R"("var0Checksum":"0xf1f2f3f4","shutdownTag":"0xf5f6f7f8","syncCount":4193975292,"var1Checksum":"0x41424344",)"
     R"("lastTransID":1162233672,"lastRecordStart":5281116304131903312,"lastFlushErrno":4227661310,)"
     R"("lastRecoveryError":1364349780,"emptyRecordStart":6149198378188823388)"), ""},

    {"takes the kind from the type where the name tells none", "cp EP_DAT_7 d; cp @iSCSI/LUN/m m; "
     "truncate -s 24576 zero; epinspect dump --json d m zero", 0,
     R"({"kind":"dat","file":"d",…}…{"kind":"map","file":"m",…}…{"kind":"head","file":"zero",…})" "\n",
     says({"zero: kind not known from its name or type, only HEAD[0] is shown",
           "zero: data start offset 0x0 lies inside the header block"})},
    {"takes no kind from a name that only resembles one", "for f in EP_TBL2 xEP_TBL EP_FRI2 EP_JNL2 EP_DAT xEP_DAT_1 "
     "@iSCSI/LUN2; do cp EP_TBL $f; epinspect dump --json $f; done | grep -c '\"kind\":\"head\"'", 0, "7\n",
     says({"EP_TBL2: kind not known from its name or type, only HEAD[0] is shown"}) + "…"},
    {"takes for a map what lies where maps lie", "cp EP_TBL @iSCSI/LUN/t; cd @iSCSI/LUN; epinspect dump --json t", 0,
     "{\"kind\":\"map\",…", says({"t: named like a map file, but its type in HEAD[0] is 1"})},
    {"takes for a kind what it is told to", "for k in tbl map dat fri jnl head; do epinspect dump --as $k EP_TBL "
     "--json; done", 0, "{\"kind\":\"tbl\",…\n{\"kind\":\"map\",…\n{\"kind\":\"dat\",…\n{\"kind\":\"fri\",…\n"
     "{\"kind\":\"jnl\",…\n" + json("head", "EP_TBL", 1, ""), ""},
    {"says what is doubtful", "cp @iSCSI/LUN/m EP_FRI; cp EP_FRI part; truncate -s +13 part; "
     "epinspect dump EP_FRI early late part", 0, "EP_FRI:\n…early:\n…late:\n…part:\n…",
     says({"EP_FRI: named like a free-index file, but its type in HEAD[0] is 4, a map file",
           "early: data start offset 0x5fff lies inside the header block",
           "late: data start offset 0x6001 lies past the end of the file",
           "part: ends inside an entry, 5 of its 8 bytes are there"})},
    {"says why a file cannot be read", "mkfifo f; ln -s l l; truncate -s 24575 EP_TBL; "
     "epinspect dump EP_TBL - . f /dev/zero l \"$(printf 'a\\033\\nb')\"", 1, "",
     says({"EP_TBL: ends too early (EP_ERR_READ_FAILED, 18990039)", "-" + missing, "." + folder, "f" + noFile,
           "/dev/zero" + noFile,
           "l: cannot be opened: Too many levels of symbolic links (EP_ERR_OPEN_FAILED, 18990038)",
           "a\\x1b\\x0ab" + missing})},
    {"writes failures as JSON too", "epinspect dump --json \"$(printf 'a\\377')\"", 1,
     R"({"kind":"error","file":"a\ufffd","fileHex":"61ff","error":"EP_ERR_OPEN_FAILED","code":18990038,)"
     "\"message\":\"a\\ufffd" + missing + "\"}\n", says({"a\\xff" + missing})},
};
// clang-format on

}  // namespace

TEST_F(Dump, OpensBlockDevices) {
    if (run("mknod device b 7 200") != 0) GTEST_SKIP() << content(".err");
    expect({"", "epinspect dump device 2>&1 | grep -c neither", 1, "0\n", ""});
}

TEST_P(Dump, Promises) { expect(GetParam()); }
INSTANTIATE_TEST_SUITE_P(, Dump, testing::ValuesIn(cases), nameOf);
