// The stand-in for the platform's library: what it reads from its list, and how it refuses.
#include <kelpiscsiep.h>

#include <cstdlib>
#include <cstring>
#include <set>

#include "Support.h"

namespace {

/// A list of one LUN in which the text `from` is replaced by `to`.
std::string list(const std::string& from = "", const std::string& to = "") {
    std::string text =
        R"([{"lid": 7, "extentSize": 4294967295, "size": 18446744073709551615, "restoreTime": -1, "type": -5,)"
        R"( "uuid": "U", "rootPath": "R", "name": "N"}])";
    if (!from.empty()) text.replace(text.find(from), from.size(), to);
    return text;
}

}  // namespace

TEST(StandIn, AnswersFromTheListAndRefusesClearly) {
    const TempDir folder;
    const std::string path = folder.path("luns.json");
    setenv("KELPISCSIEP_LUNS", path.c_str(), 1);
    unsigned char record[KELPISCSI_LUN_RECORD_SIZE + 1];
    const auto ask = [&record](unsigned int lid) {
        std::memset(record, 0, sizeof record);
        record[KELPISCSI_LUN_RECORD_SIZE] = 0x5a;
        const int result = KELPiSCSILunGetByLid(lid, 0, record);
        EXPECT_EQ(0x5a, record[KELPISCSI_LUN_RECORD_SIZE]);
        return result;
    };
    const int missing = ask(7);
    folder.write("luns.json", list("}]", "}"));
    const int malformed = ask(7);
    folder.write("luns.json", list());
    const int unknown = ask(8);
    folder.write("luns.json", list("\"N\"", "3"));
    const int bad = ask(7);
    EXPECT_EQ(4U, (std::set<int>{missing, malformed, unknown, bad}).size());
    EXPECT_EQ(5U, (std::set<std::string>{KELPiSCSIStrError(missing), KELPiSCSIStrError(malformed),
                                         KELPiSCSIStrError(unknown), KELPiSCSIStrError(bad), KELPiSCSIStrError(1)})
                      .size());

    struct Case {
        const char* from;
        std::string to;
        int expected;
    };
    for (const Case& c : {Case{"", "", 0},
                          Case{"4294967295", "4294967296", bad},
                          Case{"4294967295", "-1", bad},
                          Case{"18446744073709551615", "18446744073709551616", bad},
                          Case{"-5", "-2147483649", bad},
                          Case{"-5", "2147483648", bad},
                          Case{"-5", "1.5", bad},
                          Case{"\"U\"", "null", bad},
                          Case{"\"name\"", "\"other\"", bad},
                          Case{"7", "\"7\"", bad},
                          Case{"[", "[3,", bad},
                          Case{"\"N\"", "\"\\u0000\"", bad},
                          Case{"\"N\"", "\"\xff\"", malformed},
                          Case{"\"U\"", "\"" + std::string(73, 'u') + "\"", 0},
                          Case{"\"U\"", "\"" + std::string(74, 'u') + "\"", bad},
                          Case{"\"R\"", "\"" + std::string(4095, 'r') + "\"", bad},
                          Case{"\"N\"", "\"" + std::string(266, 'n') + "\"", 0},
                          Case{"\"N\"", "\"" + std::string(267, 'n') + "\"", bad},
                          Case{"[", "{\"a\": [", malformed},
                          Case{"[", std::string(100000, '['), malformed}}) {
        folder.write("luns.json", list(c.from, c.to));
        EXPECT_EQ(c.expected, ask(7)) << c.from << " -> " << c.to.substr(0, 80);
    }

    folder.write("luns.json", list());
    EXPECT_EQ(0, ask(7));
    unsigned long long size = 0;
    int type = 0;
    std::memcpy(&size, record + 24, 8);
    std::memcpy(&type, record + 36, 4);
    EXPECT_EQ(18446744073709551615ULL, size);
    EXPECT_EQ(-5, type);
    EXPECT_STREQ("U", reinterpret_cast<const char*>(record + 44));
    EXPECT_STREQ("R", reinterpret_cast<const char*>(record + 118));
    EXPECT_STREQ("N", reinterpret_cast<const char*>(record + 4213));

    setenv("KELPISCSIEP_LUNS", folder.path("").c_str(), 1);
    EXPECT_EQ(missing, ask(7));
}
