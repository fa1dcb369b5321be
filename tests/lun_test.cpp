// LUN configuration and file locations, with a platform library of the tests' own.
#include <ISCSIEPFileJNL.h>
#include <ISCSIEPFileMAP.h>
#include <ISCSILUNConfInfo.h>

#include <algorithm>
#include <cstring>
#include <map>

#include "Support.h"

using namespace ISCSI::TOOL;

namespace {

/// What the platform library will answer, and what it was asked.
struct Platform {
    int result = 0;
    std::string record = std::string(4480, '\0');
    unsigned int askedLid = 0;
    int askedReserved = -1;
    bool recordWasZero = false;
} platform;

template <typename Number>
void put(std::size_t offset, Number value) {
    std::memcpy(platform.record.data() + offset, &value, sizeof value);
}

void putText(std::size_t offset, const std::string& text) {
    platform.record.replace(offset, text.size(), text);
}

void answer(unsigned int extentSize, unsigned long long size, int restoreTime, int type) {
    platform = Platform();
    put(20, extentSize);
    put(24, size);
    put(32, restoreTime);
    put(36, type);
    putText(44, "abc");
    putText(118, "/volume1");
    putText(4213, "lun3");
}

}  // namespace

extern "C" __attribute__((visibility("default"))) int KELPiSCSILunGetByLid(unsigned int lid, int reserved,
                                                                           void* record) {
    platform.askedLid = lid;
    platform.askedReserved = reserved;
    const auto* bytes = static_cast<const char*>(record);
    platform.recordWasZero = std::all_of(bytes, bytes + 4480, [](char byte) { return byte == 0; });
    std::memcpy(record, platform.record.data(), 4480);  // a failed call may leave anything in the record
    return platform.result;
}

extern "C" __attribute__((visibility("default"))) const char* KELPiSCSIStrError(int code) {
    return code == -77 ? "no such thing" : "?";
}

TEST(LunConf, ARecordIsLoadedAndShown) {
    answer(1048576, 10737418240, 0, 263);
    ISCSILUNConfInfo lun(3);
    EXPECT_EQ(0, lun.loadFromConfig());
    EXPECT_EQ(3U, platform.askedLid);
    EXPECT_EQ(0, platform.askedReserved);
    EXPECT_TRUE(platform.recordWasZero);
    EXPECT_EQ(
        "lid: 3 ,extent_size: 1048576 (1MB) ,size: 10737418240 (10GB) ,restore time: Thu Jan 01 00:00:00 UTC 1970 "
        ",type: BLUN ,uuid: abc ,rootpath: /volume1 ,name: lun3",
        lun.toString());
    EXPECT_EQ(
        "lid: 0 ,extent_size: 0 (0bytes) ,size: 0 (0bytes) ,restore time: Thu Jan 01 00:00:00 UTC 1970 "
        ",type: UNKNOWN ,uuid:  ,rootpath:  ,name: ",
        ISCSILUNConfInfo().toString());
}

TEST(LunConf, AFailedLoadLeavesTheRecordAndShowsIt) {
    answer(1, 2, 3, 7);
    ISCSILUNConfInfo lun(9);
    EXPECT_EQ(0, lun.loadFromConfig());
    const std::string before = lun.toString();
    answer(4, 5, 6, 15);
    platform.result = -77;
    EXPECT_EQ(-77, lun.loadFromConfig());
    EXPECT_EQ(before, lun.toString());
    EXPECT_EQ(std::vector<std::string>{"iSCSI:ISCSILUNConfInfo.cpp:43:loadFromConfig Failed to get LUN config by LUN "
                                       "ID. info: lid: 9 ,extent_size: 1 (1bytes) ,size: 2 (2bytes) ,restore time: "
                                       "Thu Jan 01 00:00:03 UTC 1970 ,type: THIN ,uuid: abc ,rootpath: /volume1 "
                                       ",name: lun3. error: -77 (no such thing)"},
              takeLog());
}

TEST(LunConf, TextsEndAtTheirNulOrWithTheRecord) {
    answer(1, 1, 0, 1);
    putText(44, std::string(74, 'u'));     // runs on into the root path
    putText(4213, std::string(267, 'n'));  // fills the record to its last byte
    ISCSILUNConfInfo lun(1);
    EXPECT_EQ(0, lun.loadFromConfig());
    EXPECT_EQ(std::string(74, 'u') + "/volume1", lun.uuid);
    EXPECT_EQ("/volume1", lun.rootPath);
    EXPECT_EQ(std::string(267, 'n'), lun.name);
}

TEST(LunConf, TypesAreNamedByEqualityOnly) {
    const std::map<int, std::string> names = {
        // clang-format off
        {1, "BLOCK"}, {3, "FILE"}, {7, "THIN"}, {15, "ADV"}, {31, "SINK"}, {47, "VDISK_ADV"}, {71, "BKP_THIN"},
        {79, "BKP_ADV"}, {143, "CINDER"}, {259, "BLUN_THICK"}, {263, "BLUN"}, {275, "BLUN_THICK_SINK"},
        {279, "BLUN_SINK"}, {291, "VDISK_BLUN_THICK"}, {295, "VDISK_BLUN"}, {311, "VDISK_BLUN_SINK"},
        {323, "BKP_BLUN_THICK"}, {327, "BKP_BLUN"}, {387, "CINDER_BLUN_THICK"}, {391, "CINDER_BLUN"},
        {807, "VDISK_BLUN_COW"}, {1831, "VDISK_BLUN_Q9"}
        // clang-format on
    };
    const auto nameOf = [](int type) {
        ISCSILUNConfInfo lun;
        lun.type = type;
        const std::string text = lun.toString();
        const auto start = text.find(",type: ") + 7;
        return text.substr(start, text.find(' ', start) - start);
    };
    for (int type = -2; type < 2000; ++type) {
        const auto row = names.find(type);
        EXPECT_EQ(row == names.end() ? "UNKNOWN" : row->second, nameOf(type)) << type;
    }
    EXPECT_EQ("UNKNOWN", nameOf(263 - 0x7fffffff - 1));
}

TEST(LunConf, ByteCountsAreSplitIntoUnits) {
    const std::map<unsigned long long, std::string> texts = {
        // clang-format off
        {0, "0bytes"}, {1023, "1023bytes"}, {1024, "1KB"}, {1536, "1KB,512bytes"}, {1048576, "1MB"},
        {1048577, "1MB,1bytes"}, {1610612736, "1GB,512MB"}, {4294967295, "3GB,1023MB,1023KB,1023bytes"},
        {1ULL << 40, "1TB"}, {1ULL << 50, "1PB"}, {1ULL << 60, "1EB"},
        {(1ULL << 60) - 1, "1023PB,1023TB,1023GB,1023MB,1023KB,1023bytes"},
        {18446744073709551615ULL, "15EB,1023PB,1023TB,1023GB,1023MB,1023KB,1023bytes"}
        // clang-format on
    };
    for (const auto& [count, text] : texts) {
        ISCSILUNConfInfo lun;
        lun.size = count;
        const std::string expected = ",size: " + std::to_string(count) + " (" + text + ") ,restore";
        EXPECT_NE(std::string::npos, lun.toString().find(expected)) << expected;
    }
}

namespace {

struct Sibling {
    const char* suffix;
    std::string missing, invalid;  ///< lines and operation of the two failures
    std::string kind;
    int (*find)(const ISCSIEPFile& file, std::string& path);
};

const Sibling siblings[] = {
    {"EP_TBL", "106:getTBLFilePath", "110:getTBLFilePath", "TBL",
     [](const ISCSIEPFile& file, std::string& path) { return file.getTBLFilePath(path); }},
    {"EP_FRI", "129:getFRIFilePath", "133:getFRIFilePath", "FRI",
     [](const ISCSIEPFile& file, std::string& path) { return file.getFRIFilePath(path); }},
    {"EP_DAT_00000", "153:getDATFilePath", "157:getDATFilePath", "DAT",
     [](const ISCSIEPFile& file, std::string& path) { return file.getDATFilePath(0, 9, path); }}};

}  // namespace

TEST(Locations, SiblingsLieOnTheVolumeThatThePathNames) {
    const std::map<std::string, std::string> volumes = {
        // clang-format off
        {"/volume1/@iSCSI/EP/EP_TBL", "/volume1"}, {"/volume01/x", "/volume1"}, {"/volume12abc", "/volume12"},
        {"/volume \t+3", "/volume3"}, {"/volume2147483647", "/volume2147483647"},
        {"/volume0/x", "invalid"}, {"/volume-2/x", "invalid"}, {"/volume-2147483648", "invalid"},
        {"", "missing"}, {"/var/db/iscsi/EP_JNL", "missing"}, {"/volumeX", "missing"}, {"/volum", "missing"},
        {"/volume", "missing"}, {"/volume- 1", "missing"}, {"volume1", "missing"}, {"//volume1", "missing"},
        {"/volume2147483648", "missing"}, {"/volume-2147483649", "missing"}, {"/volume4294967297/%s", "missing"},
        {"/volume99999999999999999999999999/x", "missing"}
        // clang-format on
    };
    for (const auto& [own, volume] : volumes) {
        for (const Sibling& sibling : siblings) {
            std::string path = "old";
            const int code = sibling.find(ISCSIEPFile(own), path);
            if (volume[0] == '/') {
                EXPECT_EQ(0, code) << own;
                EXPECT_EQ(volume + "/@iSCSI/EP/" + sibling.suffix, path);
                continue;
            }
            EXPECT_EQ(18990401, code) << own;
            EXPECT_EQ("old", path);
            const std::string line = volume == "missing"
                                         ? sibling.missing + " Failed to get " + sibling.kind + " file path."
                                         : sibling.invalid + " Failed to get volume ID.";
            EXPECT_EQ(chain(own, {"ISCSIEPFile.cpp:" + line}), takeLog());
        }
    }
    EXPECT_TRUE(takeLog().empty());
}

TEST(Locations, DataFilesHoldFourTebibytesEach) {
    struct Case {
        unsigned int extentSize;
        unsigned long long extentAddress;
        const char* number;
    };
    for (const Case& c : {Case{1048576, 0, "00000"}, Case{1048576, 4194303, "00000"}, Case{1048576, 4194304, "00001"},
                          Case{1, 4398046511104ULL * 99999, "99999"}, Case{1, 4398046511104ULL * 100000, "100000"},
                          Case{1, 18446744073709551615ULL, "4194303"}, Case{0, 18446744073709551615ULL, "00000"},
                          Case{0xffffffff, 0xffffffff, "4194303"}, Case{2, 1ULL << 63, "00000"}}) {
        std::string path;
        EXPECT_EQ(0, ISCSIEPFile("/volume2/x").getDATFilePath(c.extentSize, c.extentAddress, path));
        EXPECT_EQ(std::string("/volume2/@iSCSI/EP/EP_DAT_") + c.number, path);
    }
}

TEST(Locations, TheMapFileFollowsTheConfigurationAndTheJournalNothing) {
    std::string path = "old";
    answer(1, 1, 0, 263);
    EXPECT_EQ(0, ISCSIEPFileMAP().getMAPFilePath(4294967295, path));
    EXPECT_EQ(4294967295, platform.askedLid);
    EXPECT_EQ("/volume1/@iSCSI/LUN/BLUNabclun3_00000", path);
    answer(1, 1, 0, 5);
    putText(118, std::string(8, '\0'));
    EXPECT_EQ(0, ISCSIEPFileMAP().getMAPFilePath(1, path));
    EXPECT_EQ("/@iSCSI/LUN/UNKNOWNabclun3_00000", path);
    platform.result = 4;
    EXPECT_EQ(4, ISCSIEPFileJNL("/own%s").getMAPFilePath(8, path));
    EXPECT_EQ("/@iSCSI/LUN/UNKNOWNabclun3_00000", path);
    const std::vector<std::string> log = takeLog();
    ASSERT_EQ(2U, log.size());
    EXPECT_EQ(0U, log[0].find("iSCSI:ISCSILUNConfInfo.cpp:43:loadFromConfig Failed to get LUN config by LUN ID. "));
    EXPECT_EQ("iSCSI:ISCSIEPFile.cpp:180:getMAPFilePath Failed to get LUN conf info. path: /own%s", log[1]);
    EXPECT_EQ(0, ISCSIEPFileJNL().getJNLFilePath(path));
    EXPECT_EQ("/var/db/iscsi/EP_JNL", path);
}
