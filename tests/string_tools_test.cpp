#include <map>

#include "Support.h"
#include "etc/ISCSIQuorinStringTool.h"

using namespace ISCSI::TOOL;

TEST(StringTools, BytesBecomeHexadecimalAndUUIDTextAndNoBytesAreRefused) {
    const unsigned char bytes[] = {0x0a, 0xde, 0xad, 0xbe, 0xef, 0, 1, 2, 3, 4, 5, 6, 7, 0x80, 0xff, 0x9f};
    std::string text = "old";
    EXPECT_EQ(18990003, GetUUIDInString(nullptr, text));
    EXPECT_EQ(Lines(), takeLog());
    EXPECT_EQ(18990003, GetHexInString(nullptr, 0, text));
    EXPECT_EQ(Lines{"iSCSI:ISCSIQuorinStringTool.h:190:GetHexInString Input pointer is NULL."}, takeLog());
    EXPECT_EQ("iSCSI:%s:%d:%s Input pointer is NULL.", logFormats.back());
    EXPECT_EQ(0, errno);
    EXPECT_EQ("old", text);
    EXPECT_EQ(0, GetHexInString(bytes, 7, text));
    EXPECT_EQ("0adeadbeef0001", text);
    EXPECT_EQ(0, GetHexInString(bytes, 0, text));
    EXPECT_EQ("", text);
    EXPECT_EQ(0, GetUUIDInString(bytes, text));
    EXPECT_EQ("0adeadbe-ef00-0102-0304-05060780ff9f", text);
    // Every byte, in every place of a block, and no digit after the last.
    static constexpr char digits[] = "0123456789abcdef";
    std::vector<unsigned char> all;
    std::string expected;
    for (unsigned int i = 0; i < 256 * 17; ++i) {
        all.push_back(static_cast<unsigned char>(i * 3));
        expected.append(1, digits[all.back() / 16]).append(1, digits[all.back() % 16]);
    }
    for (const unsigned int length : {15U, 16U, 17U, 511U, 512U, 513U, 256U * 17}) {
        EXPECT_EQ(0, GetHexInString(all.data(), length, text));
        EXPECT_EQ(expected.substr(0, 2 * std::size_t{length}), text);
    }
}

TEST(ErrorNames, AreThoseOfTheLibrarysOwnCodesAndOfNoOthers) {
    const std::map<int, std::string> names = {
        {18990003, "EP_ERR_BAD_ARGUMENT"}, {18990038, "EP_ERR_OPEN_FAILED"},     {18990039, "EP_ERR_READ_FAILED"},
        {18990041, "EP_ERR_SEEK_FAILED"},  {18990209, "EP_ERR_BAD_UUID"},        {18990400, "EP_ERR_WRONG_FILE_TYPE"},
        {18990401, "EP_ERR_NO_PATH"},      {18990507, "EP_ERR_BAD_EXTENT_SIZE"},
    };
    for (int code = 18990000; code < 18990600; ++code) {
        const char* name = GetErrorName(code);
        EXPECT_EQ(names.count(code) > 0 ? names.at(code) : "", name != nullptr ? name : "") << code;
    }
    EXPECT_EQ(nullptr, GetErrorName(0));
    EXPECT_EQ(nullptr, GetErrorName(9001));
}

TEST(StringTools, TimesFollowTheZoneAndAreSigned) {
    using Case = std::tuple<const char*, unsigned int, std::string>;
    for (const auto& [zone, seconds, text] :
         {Case{"UTC", 0, "Thu Jan 01 00:00:00 UTC 1970"}, Case{"UTC", 0x7fffffff, "Tue Jan 19 03:14:07 UTC 2038"},
          Case{"UTC", 0x80000000, "Fri Dec 13 20:45:52 UTC 1901"},
          Case{"ABC-2", 1600000000, "Sun Sep 13 14:26:40 ABC 2020"},
          Case{"CET-1CEST,M3.5.0,M10.5.0/3", 1600000000, "Sun Sep 13 14:26:40 CEST 2020"},
          Case{"ABCDEF0", 0, "Thu Jan 01 00:00:00 ABCDEF 1970"},  // just fits
          Case{"ABCDEFG0", 0, ""}}) {
        setenv("TZ", zone, 1);
        EXPECT_EQ(text, GetTimeInString(seconds)) << zone << ' ' << seconds;
    }
}
