// epinspect map and entry: the entries of a map file.
#include "ProgramTest.h"

namespace {

class Map : public ProgramTest {
protected:
    Map() {
        write("five", EPFileBuilder::map().entry(0, 0x9000000000000000).entry(1, 0x9010000000000001).entry(4, 1));
        EPFileBuilder flags = EPFileBuilder::map().entry(0, 0xc000000000000005).entry(1, 0xc000000000000006);
        write("flags", flags.entry(2, 0xa000000000000007).entry(3, 0x1000000000000008).entry(4, 0x20000000000000));
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

const std::string noFlags = "; 0 vpushed, 0 vpulled, 0 synced\n";

// clang-format off
const Case cases[] = {
    {"lists runs and sums them up", "epinspect map five; epinspect map flags", 0,
     "0: mapped synced, pool 0, extent 0\n1: mapped synced, pool 16, extent 1\n2-3: hole\n4: unmapped, pool 0, extent 1\n"
     "5 entries in 4 runs: 2 mapped, 1 unmapped, 2 holes; 0 vpushed, 0 vpulled, 2 synced\n"
     "0-1: mapped vpushed, pool 0, extents 5-6\n2: mapped vpulled, pool 0, extent 7\n"
     "3: unmapped synced, pool 0, extent 8\n4: unmapped, pool 32, extent 0\n"
     "5 entries in 4 runs: 3 mapped, 2 unmapped, 0 holes; 2 vpushed, 1 vpulled, 1 synced\n", ""},
    {"writes runs as JSON", "epinspect map --json flags --count 3; epinspect map five --first 2 --json", 0,
     R"({"kind":"run","file":"flags","first":0,"count":2,"entryOffset":24576,"extentAddress":5,"poolNumber":0,)"
     R"("mapped":true,"vpushed":true,"vpulled":false,"synced":false})" "\n"
     R"({"kind":"run","file":"flags","first":2,"count":1,"entryOffset":24592,"extentAddress":7,"poolNumber":0,)"
     R"("mapped":true,"vpushed":false,"vpulled":true,"synced":false})" "\n"
     R"({"kind":"summary","file":"flags","summary":true,"entries":3,"mapped":3,"unmapped":0,"vpushed":2,"vpulled":1,)"
     R"("synced":0,"holes":0,"runs":2})" "\n"
     R"({"kind":"run","file":"five","first":2,"count":2,"entryOffset":24592,"hole":true})" "\n{\"kind\":\"run\",…}\n"
     R"({"kind":"summary","file":"five","summary":true,"entries":3,"mapped":0,"unmapped":1,"vpushed":0,"vpulled":0,)"
     R"("synced":0,"holes":2,"runs":2})" "\n", ""},
    {"takes parts however many blocks they touch", "epinspect map five --first=3 --count=1; epinspect map none; epinspect map "
     "holes --first 4095 --count 5000; epinspect map holes --first 19998 --count 18446744073709551615", 0,
     "3: hole\n1 entry in 1 run: 0 mapped, 0 unmapped, 1 hole" + noFlags +
     "0 entries in 0 runs: 0 mapped, 0 unmapped, 0 holes" + noFlags +
     "4095-9094: hole\n5000 entries in 1 run: 0 mapped, 0 unmapped, 5000 holes" + noFlags +
     "19998-19999: hole\n2 entries in 1 run: 0 mapped, 0 unmapped, 2 holes" + noFlags, ""},
    {"draws a chart", "epinspect map five --chart", 0, "0 |##...|\nOne cell: 1 entry\n"
     "Mapped: . none  - <1/3  + <2/3  * most  # all\n"
     "5 entries in 4 runs: 2 mapped, 1 unmapped, 2 holes; 0 vpushed, 0 vpulled, 2\nsynced\n", ""},
    {"shows entries", "epinspect entry flags 3 0x0-0X1; epinspect entry holes 1-9000 | tail -n 1", 0,
     "3: pool number: 0 ,extent address: 8 ,mapped: false ,vpushed: false ,vpulled: false ,synced: true\n"
     "0: pool number: 0 ,extent address: 5 ,mapped: true ,vpushed: true ,vpulled: false ,synced: false\n"
     "1: pool number: 0 ,extent address: 6 ,mapped: true ,vpushed: true ,vpulled: false ,synced: false\n"
     "9000: pool number: 0 ,extent address: 0 ,mapped: false ,vpushed: false ,vpulled: false ,synced: false\n", ""},
    {"writes entries as JSON", "epinspect entry --json flags 4-4", 0,
     R"({"kind":"entry","file":"flags","index":4,"entryOffset":24608,"extentAddress":0,"poolNumber":32,"mapped":false,)"
     R"("vpushed":false,"vpulled":false,"synced":false})" "\n", ""},
    {"refuses positions behind the end", "epinspect entry five 4-9 18446744073709551615 2305843009213690880 4; "
     "for n in 5 18446744073709551615; do epinspect map five --first $n; done; epinspect map none --first 1", 1,
     "4: pool number: 0 ,extent address: 1 …\n4: pool number: 0 ,extent address: 1 …\n",
     "epinspect: five: entry 5: " + beyondEnd("0-4") + "epinspect: five: entry 18446744073709551615: " + beyondEnd("0-4") +
     "epinspect: five: entry 2305843009213690880: " + beyondEnd("0-4") + "epinspect: five: entry 5: " + beyondEnd("0-4") +
     "epinspect: five: entry 18446744073709551615: " + beyondEnd("0-4") + "epinspect: none: entry 1: " + beyondEnd("none")},
    {"says what is doubtful or no map", "printf x >>none; for f in far none data; do epinspect map $f; epinspect entry $f 0; "
     "done", 1, "0 entries…0 entries…", "epinspect: far: data start offset 0x7ffffffffffffff8 lies behind the end of the file\n"
     "epinspect: far: data start offset 0x7ffffffffffffff8 lies behind the end of the file\n"
     "epinspect: far: entry 0: " + beyondEnd("none") + "epinspect: none: ends inside an entry, of which 1 bytes are there\n"
     "epinspect: none: entry 0: " + beyondEnd("none") + "epinspect: data: " + wrongType + "epinspect: data: entry 0: " + wrongType},
    {"says where a map became unreadable", meanwhile("epinspect map many", "rm many"), 1,
     "4095: unmapped, pool 2615, extent 2029926973911601\n", "epinspect: many: entry 4096: " + missing},
    {"says where entries became unreadable", meanwhile("epinspect entry many 1-9999", "rm many"), 1,
     "4096: pool number: 2615 ,…\n", "epinspect: many: entry 4097: " + missing},
    {"says when a map became shorter", meanwhile("epinspect map many --json", "truncate -s 57344 many"), 1,
     "{\"kind\":\"error\",\"file\":\"many\",\"error\":\"EP_ERR_READ_FAILED\",\"code\":18990039,…",
     "epinspect: many: entry 4096: the file has become shorter while it was read (EP_ERR_READ_FAILED, 18990039)\n"},
};
// clang-format on

}  // namespace

TEST_P(Map, Promises) { expect(GetParam()); }
INSTANTIATE_TEST_SUITE_P(, Map, testing::ValuesIn(cases), nameOf);
