// The stand-in for the platform's library: what it reads from its list, and how it refuses.
#include <kelpiscsiep.h>

#include <cstring>
#include <set>

#include "Support.h"

TEST(StandIn, AnswersFromTheListAndRefusesClearly) {
    const TempDir folder;
    const std::string path = folder.path("luns.json");
    setenv("KELPISCSIEP_LUNS", path.c_str(), 1);
    std::string record;
    const auto ask = [&record](unsigned int lid) {
        record.assign(KELPISCSI_LUN_RECORD_SIZE, '\0');
        const int result = KELPiSCSILunGetByLid(lid, 0, record.data());
        EXPECT_EQ('\0', record.data()[KELPISCSI_LUN_RECORD_SIZE]);  // what lies behind it stays as it was
        return result;
    };
    // Asks for LUN 7 of a list in which the text `from` is replaced by `to`.
    const auto askWith = [&](const std::string& from, const std::string& to) {
        std::string list =
            R"([{"lid": 7, "extentSize": 4294967295, "size": 18446744073709551615, "restoreTime": -1, "type": -5,)"
            R"( "uuid": "U", "rootPath": "R", "name": "N"}])";
        std::ofstream(path) << list.replace(list.find(from), from.size(), to);
        return ask(7);
    };
    const auto quoted = [](std::size_t length) { return '"' + std::string(length, 'x') + '"'; };
    const int missing = ask(7), malformed = askWith("}]", "}"), bad = askWith("\"N\"", "3");
    EXPECT_EQ(0, askWith("7", "7"));
    const int unknown = ask(8);
    std::set<std::string> texts;
    for (const int code : {0, 1, missing, malformed, bad, unknown}) texts.insert(KELPiSCSIStrError(code));
    EXPECT_EQ(6U, texts.size());

    using Case = std::tuple<std::string, std::string, int>;
    // clang-format off
    for (const auto& [from, to, expected] : {
        Case{"4294967295", "4294967296", bad}, Case{"4294967295", "-1", bad}, Case{"-5", "-2147483649", bad},
        Case{"18446744073709551615", "18446744073709551616", bad}, Case{"-5", "2147483648", bad}, Case{"-5", "1.5", bad},
        Case{"\"U\"", "null", bad}, Case{"\"name\"", "\"other\"", bad}, Case{"7", "\"7\"", bad}, Case{"[", "[3,", bad},
        Case{"\"N\"", "\"\\u0000\"", bad}, Case{"\"N\"", "\"\xff\"", malformed}, Case{"\"U\"", quoted(73), 0},
        Case{"\"U\"", quoted(74), bad}, Case{"\"R\"", quoted(4094), 0}, Case{"\"R\"", quoted(4095), bad},
        Case{"\"N\"", quoted(266), 0}, Case{"\"N\"", quoted(267), bad}, Case{"[", "{\"a\": [", malformed},
        Case{"[", std::string(100000, '['), malformed}}) {
        EXPECT_EQ(expected, askWith(from, to)) << from << " -> " << to.substr(0, 80);
    }
    // clang-format on
    EXPECT_EQ(0, askWith("7", "7"));
    EXPECT_EQ(std::string(16, '\xff') + "\xfb\xff\xff\xff", record.substr(20, 20));
    for (const auto& [offset, text] : {std::pair{44U, "U"}, {118U, "R"}, {4213U, "N"}})
        EXPECT_STREQ(text, &record[offset]);
    setenv("KELPISCSIEP_LUNS", folder.path("").c_str(), 1);
    EXPECT_EQ(missing, ask(7));
}
