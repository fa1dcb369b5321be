// epinspect map and entry: the entries of a map file.
#include "ProgramTest.h"

namespace {

class Map : public ProgramTest {
protected:
    Map() {
        EPFileBuilder seven = EPFileBuilder::map().entry(0, 0xc000000000000005).entry(1, 0xc000000000000006);
        seven.entry(2, 0xa010000000000007).entry(5, 0x1000000000000008).entry(6, 0x4000000000000009);
        write("seven", seven);
        constexpr std::uint64_t top[] = {0x800, 0x800, 0x801, 0x001, 0x401, 0x601, 0x701, 0, 0x001, 0x001, 0x100, 0, 0};
        EPFileBuilder unlike = EPFileBuilder::map();
        for (std::uint64_t i = 0; i < 9000; ++i)
            unlike.entry(i, i < 13 ? top[i] << 52U | (i < 7 ? i : 0) : top[0] << 52U | i);
        write("unlike", unlike);
        write("none", EPFileBuilder::map());
        write("holes", EPFileBuilder::map().resize(24576 + 8 * 20000));
        write("data", EPFileBuilder::data());
        write("far", EPFileBuilder::map().set(epbuilder::head0::dataStartOffset, 0x7ffffffffffffff8));
    }
};

/// A map of 20000 entries, of which `command` lists more than fits a pipe; something happens to it before its second
/// block is read.
std::string meanwhile(const std::string& command, const std::string& happens) {
    return "{ cat none; yes 1234567 | head -c 160000; } >many; { " + command + "; echo $? >status; } | { read line; " +
           happens + "; tail -n 1; }; exit $(cat status)";
}

const std::string startsFar = ": data start offset 0x7ffffffffffffff8 lies past the end of the file";
const std::string noFlags = "; 0 vpushed, 0 vpulled, 0 synced\n";

// clang-format off
const Case cases[] = {
    {"lists runs and sums them up", "epinspect map seven", 0,
     "0-1: mapped vpushed, pool 0, extents 5-6\n2: mapped vpulled, pool 16, extent 7\n3-4: hole\n"
     "5: unmapped synced, pool 0, extent 8\n6: unmapped vpushed, pool 0, extent 9\n"
     "7 entries in 5 runs: 3 mapped, 2 unmapped, 2 holes; 3 vpushed, 1 vpulled, 1 synced\n", ""},
    {"writes runs and their sums as JSON", "epinspect map --json seven", 0,
     R"({"kind":"run","file":"seven","first":0,"count":2,"entryOffset":24576,"extentAddress":5,"poolNumber":0,)"
     R"("mapped":true,"vpushed":true,"vpulled":false,"synced":false})" "\n"
     R"({"kind":"run","file":"seven","first":2,"count":1,"entryOffset":24592,"extentAddress":7,"poolNumber":16,)"
     R"("mapped":true,"vpushed":false,"vpulled":true,"synced":false})" "\n"
     R"({"kind":"run","file":"seven","first":3,"count":2,"entryOffset":24600,"hole":true})" "\n"
     R"({"kind":"run",…"first":5,"count":1,"entryOffset":24616,…"mapped":false,"vpushed":false,…"synced":true})" "\n"
     R"({"kind":"run",…"first":6,"count":1,"entryOffset":24624,…"mapped":false,"vpushed":true,…"synced":false})" "\n"
     R"({"kind":"summary","file":"seven","summary":true,"entries":7,"mapped":3,"unmapped":2,"vpushed":3,"vpulled":1,)"
     R"("synced":1,"holes":2,"runs":5,"changed":[]})" "\n", ""},
    {"draws a chart", "epinspect map seven --chart", 0, "0 |###....|\nOne cell: 1 entry\n"
     "Mapped: . none  - <1/3  + <2/3  * most  # all\n"
     "7 entries in 5 runs: 3 mapped, 2 unmapped, 2 holes; 3 vpushed, 1 vpulled, 1\nsynced\n", ""},
    {"sums up the maps of the sample store", "for m in store/volume*/@iSCSI/LUN/*; do "
     "epinspect map $m | tail -n 1; done", 0,
     "4096 entries in 402 runs: 2256 mapped, 0 unmapped, 1840 holes; 96 vpushed, 48 vpulled, 1200 synced\n"
     "1024 entries in 7 runs: 176 mapped, 0 unmapped, 848 holes; 32 vpushed, 16 vpulled, 0 synced\n"
     "256 entries in 20 runs: 128 mapped, 0 unmapped, 128 holes; 48 vpushed, 16 vpulled, 112 synced\n", ""},
    {"takes a part, however small or large", "epinspect map seven --first=3 --count=1; epinspect map none; "
     "epinspect map holes --first 4095 --count 5000; epinspect map holes --first 19998 --count 18446744073709551615", 0,
     "3: hole\n1 entry in 1 run: 0 mapped, 0 unmapped, 1 hole" + noFlags +
     "0 entries in 0 runs: 0 mapped, 0 unmapped, 0 holes" + noFlags +
     "4095-9094: hole\n5000 entries in 1 run: 0 mapped, 0 unmapped, 5000 holes" + noFlags +
     "19998-19999: hole\n2 entries in 1 run: 0 mapped, 0 unmapped, 2 holes" + noFlags, ""},
    {"shows entries", "epinspect entry seven 5 0x0-0X1; epinspect entry holes 1-9000 | tail -n 1", 0,
     "5: pool number: 0 ,extent address: 8 ,mapped: false ,vpushed: false ,vpulled: false ,synced: true\n"
     "0: pool number: 0 ,extent address: 5 ,mapped: true ,vpushed: true ,vpulled: false ,synced: false\n"
     "1: pool number: 0 ,extent address: 6 ,mapped: true ,vpushed: true ,vpulled: false ,synced: false\n"
     "9000: pool number: 0 ,extent address: 0 ,mapped: false ,vpushed: false ,vpulled: false ,synced: false\n", ""},
    {"writes entries as JSON", "epinspect entry --json seven 2-2", 0,
     R"({"kind":"entry","file":"seven","index":2,"entryOffset":24592,"extentAddress":7,"poolNumber":16,"mapped":true,)"
     R"("vpushed":false,"vpulled":true,"synced":false})" "\n", ""},
    {"refuses entries past the end and goes on", "epinspect entry seven 6-9 18446744073709551615 2305843009213690880 "
     "6", 1, "6: pool number: 0 ,…\n6: pool number: 0 ,…\n", says({"seven: entry 7" + holds("0-6"),
     "seven: entry 18446744073709551615" + holds("0-6"), "seven: entry 2305843009213690880" + holds("0-6")})},
    {"refuses to start past the end", "for n in 7 18446744073709551615; do epinspect map seven --first $n; done; "
     "epinspect map none --first 1", 1, "", says({"seven: entry 7" + holds("0-6"),
     "seven: entry 18446744073709551615" + holds("0-6"), "none: entry 1" + holds("none")})},
    {"says what is doubtful", "printf x >>none; epinspect map none; epinspect map far; epinspect entry far 0", 1,
     "0 entries…0 entries…", says({"none: ends inside an entry, 1 of its 8 bytes are there",
     "far" + startsFar, "far" + startsFar, "far: entry 0" + holds("none")})},
    {"refuses what is no map", "epinspect map data; epinspect entry data 0", 1, "",
     says({"data" + wrongType, "data: entry 0" + wrongType})},
    {"says where a map became unreadable", meanwhile("epinspect map many", "rm many"), 1,
     "4095: unmapped, pool 2615, extent 2029926973911601\n", says({"many: entry 4096" +
     missing, "many: has changed while it was read"})},
    {"says where entries became unreadable", meanwhile("epinspect entry many 1-9999", "rm many"), 1,
     "4096: pool number: 2615 ,…\n", says({"many: entry 4097" + missing,
     "many: has changed while it was read"})},
    {"says when a map became shorter", meanwhile("epinspect map many --json", "truncate -s 57344 many"), 1,
     "{\"kind\":\"error\",\"file\":\"many\",\"error\":\"EP_ERR_READ_FAILED\",\"code\":18990039,…",
     says({"many: entry 4096: the file has become shorter while it was read (EP_ERR_READ_FAILED, 18990039)",
     "many: has changed while it was read"})},
};
// clang-format on

}  // namespace

TEST_P(Map, Promises) { expect(GetParam()); }
INSTANTIATE_TEST_SUITE_P(, Map, testing::ValuesIn(cases), nameOf);
