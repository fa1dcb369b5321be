// LUN configuration and file locations, with a platform library of the tests' own.
#include <ISCSIEPFileJNL.h>
#include <ISCSIEPFileMAP.h>
#include <ISCSILUNConfInfo.h>

#include <cerrno>
#include <cstring>
#include <map>
#include <tuple>

#include "Support.h"

using namespace ISCSI::TOOL;

namespace {

/// What the platform library will answer, and what it was asked.
int result = 0;
std::string record(4480, '\0');
unsigned int askedLid = 0;

/// Makes a record; the UUID is abc, the root path /volume1, the name lun3.
void answer(unsigned int extentSize, unsigned long long size, int type) {
    record.assign(4480, '\0');
    std::memcpy(&record[20], &extentSize, 4);
    std::memcpy(&record[24], &size, 8);
    const unsigned int restoreTime = 0x9122333c;
    std::memcpy(&record[32], &restoreTime, 4);
    std::memcpy(&record[36], &type, 4);
    record.replace(44, 3, "abc").replace(118, 8, "/volume1").replace(4213, 4, "lun3");
    result = 0;
}

}  // namespace

extern "C" __attribute__((visibility("default"))) int KELPiSCSILunGetByLid(unsigned int lid, int reserved, void* to) {
    askedLid = lid;
    EXPECT_EQ(0, reserved);
    EXPECT_EQ(0U, reinterpret_cast<std::uintptr_t>(to) % 8);  // for that library it is a structure with such numbers
    EXPECT_EQ(std::string(4480, '\0'), std::string(static_cast<const char*>(to), 4480));
    std::memcpy(to, record.data(), 4480);  // a failed call may leave anything in the record
    errno = EIO;
    return result;
}

extern "C" __attribute__((visibility("default"))) const char* KELPiSCSIStrError(int code) {
    errno = EDOM;
    return code == -77 ? "no such thing" : nullptr;
}

TEST(LunConf, ARecordIsLoadedWholeOrNotAtAll) {
    answer(1048576, 10737418240, 263);
    ISCSILUNConfInfo lun(3);
    EXPECT_EQ(0, lun.loadFromConfig());
    EXPECT_EQ(3U, askedLid);
    const std::string line =
        "lid: 3 ,extent_size: 1048576 (1MB) ,size: 10737418240 (10GB) ,restore time: Sun Jan 22 21:06:04 UTC 1911 "
        ",type: BLUN ,uuid: abc ,rootpath: /volume1 ,name: lun3";
    EXPECT_EQ(line, lun.toString());
    answer(4, 5, 15);
    result = -77;
    EXPECT_EQ(-77, lun.loadFromConfig());
    EXPECT_EQ(line, lun.toString());
    EXPECT_EQ(Lines{"iSCSI:ISCSILUNConfInfo.cpp:43:loadFromConfig Failed to get LUN config by LUN ID. info: " + line +
                    ". error: -77 (no such thing)"},
              takeLog());
    EXPECT_EQ(EIO, errno);
    EXPECT_EQ("no such thing", ISCSILUNConfInfo::getErrorText(-77));
    EXPECT_EQ("", ISCSILUNConfInfo::getErrorText(4));
    EXPECT_EQ(EIO, errno);
    answer(0xa1b2c3d4, 0xf1e2d3c4b5a69788, -0x0e1d2c3c);
    EXPECT_EQ(0, lun.loadFromConfig());
    EXPECT_EQ(0xa1b2c3d4, lun.extentSize);
    EXPECT_EQ(0xf1e2d3c4b5a69788, lun.size);
    EXPECT_EQ(0x9122333cU, lun.restoreTime);
    EXPECT_EQ(-0x0e1d2c3c, lun.type);
    EXPECT_EQ(
        "lid: 0 ,extent_size: 0 (0bytes) ,size: 0 (0bytes) ,restore time: Thu Jan 01 00:00:00 UTC 1970 "
        ",type: UNKNOWN ,uuid:  ,rootpath:  ,name: ",
        ISCSILUNConfInfo().toString());
}

TEST(LunConf, TextsEndAtTheirNulOrWithTheRecord) {
    answer(1, 1, 1);
    record.replace(44, 74, std::string(74, 'u'));      // runs on into the root path
    record.replace(4213, 267, std::string(267, 'n'));  // fills the record to its last byte
    ISCSILUNConfInfo lun(1);
    EXPECT_EQ(0, lun.loadFromConfig());
    EXPECT_EQ(std::string(74, 'u') + "/volume1", lun.uuid);
    EXPECT_EQ("/volume1", lun.rootPath);
    EXPECT_EQ(std::string(267, 'n'), lun.name);
}

TEST(LunConf, TypesAreNamedByEqualityOnlyAndByteCountsSplitIntoUnits) {
    // clang-format off
    const std::map<int, std::string> names = {
        {1, "BLOCK"}, {3, "FILE"}, {7, "THIN"}, {15, "ADV"}, {31, "SINK"}, {47, "VDISK_ADV"}, {71, "BKP_THIN"},
        {79, "BKP_ADV"}, {143, "CINDER"}, {259, "BLUN_THICK"}, {263, "BLUN"}, {275, "BLUN_THICK_SINK"},
        {279, "BLUN_SINK"}, {291, "VDISK_BLUN_THICK"}, {295, "VDISK_BLUN"}, {311, "VDISK_BLUN_SINK"},
        {323, "BKP_BLUN_THICK"}, {327, "BKP_BLUN"}, {387, "CINDER_BLUN_THICK"}, {391, "CINDER_BLUN"},
        {807, "VDISK_BLUN_COW"}, {1831, "VDISK_BLUN_Q9"}};
    const std::map<unsigned long long, std::string> counts = {
        {0, "0bytes"}, {1023, "1023bytes"}, {1024, "1KB"}, {1536, "1KB,512bytes"}, {1048576, "1MB"},
        {1048577, "1MB,1bytes"}, {1610612736, "1GB,512MB"}, {4294967295, "3GB,1023MB,1023KB,1023bytes"},
        {1ULL << 40, "1TB"}, {1ULL << 50, "1PB"}, {1ULL << 60, "1EB"},
        {(1ULL << 60) - 1, "1023PB,1023TB,1023GB,1023MB,1023KB,1023bytes"},
        {18446744073709551615ULL, "15EB,1023PB,1023TB,1023GB,1023MB,1023KB,1023bytes"}};
    // clang-format on
    ISCSILUNConfInfo lun;
    for (lun.type = -2; lun.type < 2000; ++lun.type) {
        const std::string name = names.count(lun.type) > 0 ? names.at(lun.type) : "UNKNOWN";
        EXPECT_EQ(name, lun.getTypeName()) << lun.type;
        EXPECT_NE(std::string::npos, lun.toString().find(" ,type: " + name + " ,uuid")) << lun.type;
    }
    for (const auto& [count, text] : counts) {
        lun.size = count;
        const std::string expected = " ,size: " + std::to_string(count) + " (" + text + ") ,restore";
        EXPECT_NE(std::string::npos, lun.toString().find(expected)) << expected;
    }
}

TEST(Locations, SiblingsLieOnTheVolumeThatThePathNames) {
    // clang-format off
    const std::map<std::string, int> volumes = {  // 0: not above 0, -1: missing
        {"/volume1/@iSCSI/EP/EP_TBL", 1}, {"/volume01/x", 1}, {"/volume12abc", 12}, {"/volume \t+3", 3},
        {"/volume2147483647", 2147483647}, {"/volume0/x", 0}, {"/volume-2/x", 0}, {"/volume-2147483648", 0}, {"", -1},
        {"/var/db/iscsi/EP_JNL", -1}, {"/volumeX", -1}, {"/volum", -1}, {"/volume", -1}, {"/volume- 1", -1},
        {"volume1", -1}, {"//volume1", -1}, {"/volume2147483648", -1}, {"/volume-2147483649", -1},
        {"/volume4294967297/%s", -1}, {"/volume99999999999999999999999999/x", -1}};
    // clang-format on
    std::string own;
    int volume = 0;
    const auto expect = [&](int code, const std::string& path, const std::string& kind, const char* name, int line) {
        const bool found = volume > 0;
        EXPECT_EQ(found ? 0 : 18990401, code) << own;
        EXPECT_EQ(found ? "/volume" + std::to_string(volume) + "/@iSCSI/EP/" + name : "old", path);
        const std::string message = volume == 0 ? "volume ID." : kind + " file path.";
        const std::string source = "ISCSIEPFile.cpp:" + std::to_string(volume == 0 ? line + 4 : line) + ":get" + kind;
        EXPECT_EQ(found ? Lines() : chain(own, {source + "FilePath Failed to get " + message}), takeLog());
    };
    for (const auto& row : volumes) {
        std::tie(own, volume) = row;
        const ISCSIEPFile file(own);
        std::string table = "old", freeIndex = "old", data = "old";
        expect(file.getTBLFilePath(table), table, "TBL", "EP_TBL", 106);
        expect(file.getFRIFilePath(freeIndex), freeIndex, "FRI", "EP_FRI", 129);
        expect(file.getDATFilePath(0, 9, data), data, "DAT", "EP_DAT_00000", 153);
    }
}

TEST(Locations, DataFilesHoldFourTebibytesEach) {
    using Case = std::tuple<unsigned int, unsigned long long, std::string>;
    for (const auto& [extentSize, extentAddress, number] :
         {Case{1048576, 0, "00000"}, Case{1048576, 4194303, "00000"}, Case{1048576, 4194304, "00001"},
          Case{1, 4398046511104ULL * 99999, "99999"}, Case{1, 4398046511104ULL * 100000, "100000"},
          Case{1, 18446744073709551615ULL, "4194303"}, Case{0, 18446744073709551615ULL, "00000"},
          Case{0xffffffff, 0xffffffff, "4194303"}, Case{2, 1ULL << 63, "00000"}}) {
        std::string path;
        EXPECT_EQ(0, ISCSIEPFile("/volume2/x").getDATFilePath(extentSize, extentAddress, path));
        EXPECT_EQ("/volume2/@iSCSI/EP/EP_DAT_" + number, path);
    }
}

TEST(Locations, TheMapFileFollowsTheConfigurationAndTheJournalNothing) {
    std::string path = "old";
    answer(1, 1, 263);
    EXPECT_EQ(0, ISCSIEPFileMAP().getMAPFilePath(4294967295, path));
    EXPECT_EQ(4294967295, askedLid);
    EXPECT_EQ("/volume1/@iSCSI/LUN/BLUNabclun3_00000", path);
    answer(1, 1, 5);
    record[118] = '\0';
    EXPECT_EQ(0, ISCSIEPFileMAP().getMAPFilePath(1, path));
    EXPECT_EQ("/@iSCSI/LUN/UNKNOWNabclun3_00000", path);
    result = 4;
    EXPECT_EQ(4, ISCSIEPFileJNL("/own%s").getMAPFilePath(8, path));
    EXPECT_EQ("/@iSCSI/LUN/UNKNOWNabclun3_00000", path);
    const Lines log = takeLog();
    ASSERT_EQ(2U, log.size());
    EXPECT_EQ(0U, log[0].find("iSCSI:ISCSILUNConfInfo.cpp:43:loadFromConfig "));
    EXPECT_NE(std::string::npos, log[0].find(" error: 4 (no text)"));
    EXPECT_EQ("iSCSI:ISCSIEPFile.cpp:180:getMAPFilePath Failed to get LUN conf info. path: /own%s", log[1]);
    EXPECT_EQ(0, ISCSIEPFileJNL().getJNLFilePath(path));
    EXPECT_EQ("/var/db/iscsi/EP_JNL", path);
}
