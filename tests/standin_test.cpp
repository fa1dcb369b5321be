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
    const auto quoted = [](std::size_t length) { return '"' + std::string(length, 'x') + '"'; };
    const Case cases[] = {
        // clang-format off
        {"", "", 0}, {"4294967295", "4294967296", bad}, {"4294967295", "-1", bad}, {"-5", "-2147483649", bad},
        {"18446744073709551615", "18446744073709551616", bad}, {"-5", "2147483648", bad}, {"-5", "1.5", bad},
        {"\"U\"", "null", bad}, {"\"name\"", "\"other\"", bad}, {"7", "\"7\"", bad}, {"[", "[3,", bad},
        {"\"N\"", "\"\\u0000\"", bad}, {"\"N\"", "\"\xff\"", malformed},
        {"\"U\"", quoted(73), 0}, {"\"U\"", quoted(74), bad}, {"\"R\"", quoted(4094), 0}, {"\"R\"", quoted(4095), bad},
        {"\"N\"", quoted(266), 0}, {"\"N\"", quoted(267), bad},
        {"[", "{\"a\": [", malformed}, {"[", std::string(100000, '['), malformed}
        // clang-format on
    };
    for (const Case& c : cases) {
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
