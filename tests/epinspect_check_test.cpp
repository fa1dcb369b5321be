// epinspect diff, find and check: what differs, who uses an extent, what does not fit together.
#include "ProgramTest.h"

namespace {

namespace head0 = epbuilder::head0;
namespace map = epbuilder::map;
using epbuilder::dat::serialNumber;

constexpr std::uint64_t m = 0x8000000000000000, synced = 0x1000000000000000, pool1 = 0x0001000000000000;

/// A map of these entries, whose header fits them.
EPFileBuilder mapOf(const std::vector<std::uint64_t>& entries, std::uint64_t dataStart = 24576) {
    std::uint64_t mappedCount = 0, syncCount = 0;
    std::string content;
    for (const std::uint64_t entry : entries) {
        content += epbuilder::littleEndian(entry, 8);
        mappedCount += entry >> 63U;
        syncCount += entry >> 60U & 1U;
    }
    EPFileBuilder file = EPFileBuilder::map().set(head0::dataStartOffset, dataStart).bytes(dataStart, content);
    return file.set(map::totalCount, entries.size()).set(map::mappedCount, mappedCount).set(map::syncCount, syncCount);
}

class Check : public ProgramTest {
protected:
    Check() {
        write("a", mapOf({m, m + 1, m + 2, m + 3, m + 4, m + 5, 0, 0, 7}));
        write("b", mapOf({m, m + 9, m + 7, m + synced + 3, m + synced + 4, 0, 0, 6, 0, 0}, 32768));
        write("none", mapOf({}));
        write("pools", mapOf({m + pool1 + 4, m + pool1 + 5, 0, m + 5, m + 16 * pool1, 0, 5}));
        write("x", mapOf({m + 10, m + 11, m + 12, m + 13, 0, m + 11, pool1 + 12}));
        write("one", mapOf({0}));
        write("first", mapOf({m + 50, m + 51}));
        write("second", mapOf({0, 0, m + 52, m + 53}));
        write("both", mapOf({m + 50, m + 51, m + 52, m + 53}));
        write("there", mapOf({m + 10, m + 11, m + 30}));
        write("back", mapOf({m + 30, m + 10, m + 11}));
        write("late", EPFileBuilder::data().set(head0::dataStartOffset, 24577));
        write("y", mapOf({m + synced + 12, m + 13, m + 14, m + 16 * pool1 + 10}));
        write("other/x", mapOf({m + 10}));
        write("p/EP_DAT_7x", EPFileBuilder::data().set(head0::version, 9).set(head0::magicCode, 9));
        write("p/x", mapOf({m}).set(map::seg0PoolCount, 1024));
        write("p/volume1/@iSCSI/LUN/m", mapOf({m}));
        write("p/volume1/@iSCSI/LUN/t", EPFileBuilder::table().set(head0::version, 8));
        std::vector<std::uint64_t> large(20000), moved(20000), scattered(20000);
        for (std::size_t i = 0; i < 20000; ++i) {
            large[i] = m + 4096 + i;
            moved[i] = i / 200 == 20 ? m + i : large[i];
            scattered[i] = i % 2 * (i + 10);
        }
        write("large", mapOf(large));
        write("moved", mapOf(moved));
        write("scattered", mapOf(scattered));
        // Of extents of 1 MiB, 4194304 fill a data file. The first one lacks a byte, the second one holds one extent.
        EPFileBuilder data = EPFileBuilder::data();
        write("volume1/@iSCSI/EP/EP_DAT_00000", data.set(serialNumber, 0).resize(24575 + (std::uint64_t{1} << 42U)));
        write("volume1/@iSCSI/EP/EP_DAT_00001", data.set(serialNumber, 1).resize(24576 + (1U << 20U)));
        const std::uint64_t n = m + 0x400000;
        write("volume1/@iSCSI/LUN/m",
              mapOf({n - 2, n - 1, n, n + 1, n + 2, m + 0x800000, m + 0x7ffffffffff, m + 0x80000000000}));
    }
};

const std::string shorter =
    "epinspect: s: entry …: the file has become shorter while it was read (EP_ERR_…)\nepinspect: s: has changed while "
    "it was read\n";

// clang-format off
const Case cases[] = {
    {"diff tells runs of differences", "epinspect diff --entries a b", 3,
     "1-2: moved: mapped, pool 0, extents 1-2 -> mapped, pool 0, extent 9 ...\n"
     "3-4: flags changed: mapped, pool 0, extents 3-4 -> mapped synced, pool 0, extents 3-4\n"
     "5: only in the first: mapped, pool 0, extent 5\n7: only in the second: unmapped, pool 0, extent 6\n"
     "8: only in the first: unmapped, pool 0, extent 7\n"
     "10 entries: 3 same, 2 only in the first, 1 only in the second, 2 moved, 2 with other flags\n", ""},
    {"diff writes both entries as JSON", "epinspect diff --entries none y --json; epinspect diff --entries a b --json |"
     " cut -d, -f 4-6 | head -n 5", 0,
     R"({"kind":"difference","file":"none","otherFile":"y","first":0,"count":4,"difference":"only-second","a":null,)"
     R"("b":{"extentAddress":12,"poolNumber":0,"mapped":true,"vpushed":false,"vpulled":false,"synced":true}}
{"kind":"summary","file":"none","otherFile":"y","summary":true,"fields":0,"same":0,"onlyFirst":0,"onlySecond":4,)"
     R"("moved":0,"flags":0,"changed":[]}
"first":1,"count":2,"difference":"moved"
"first":3,"count":2,"difference":"flags"
"first":5,"count":1,"difference":"only-first"
"first":7,"count":1,"difference":"only-second"
"first":8,"count":1,"difference":"only-first"
)", ""},
    {"diff joins what stands against a hole and what stands against nothing",
     "epinspect diff --entries x one; epinspect diff --entries one x", 3,
     "0-3: only in the first: mapped, pool 0, extents 10-13\n5-6: only in the first: mapped, pool 0, extent 11 ...\n"
     "7 entries: 1 same, 6 only in the first, 0 only in the second, 0 moved, 0 with other flags\n"
     "0-3: only in the second: mapped, pool 0, extents 10-13\n…", ""},
    {"diff takes a hole for nothing", "cp a b; truncate -s +24 b; "
     "epinspect diff --entries a b && epinspect diff --entries b a", 0,
     "12 entries: no difference\n12 entries: no difference\n", ""},
    {"map joins what two blocks share", "epinspect map large", 0,
     "0-19999: mapped, pool 0, extents 4096-24095\n20000 entries in 1 run: 20000 mapped, …\n", ""},
    {"diff joins what two blocks share", "epinspect diff --entries large moved", 3,
     "4000-4199: moved: mapped, pool 0, extents 8096-8295 -> mapped, pool 0, extents 4000-4199\n"
     "20000 entries: 19800 same, 0 only in the first, 0 only in the second, 200 moved, 0 with other flags\n", ""},
    {"find tells owners across LUNs", "epinspect --root store find --extent 63-64; "
     "epinspect --root store find --pool 32 --json | grep -om1 '\"lid.*first\":[0-9]*'", 0,
     "/volume1/@iSCSI/LUN/BLUN…lun1_00000: LUN 1: 63-64: mapped synced, pool 0, extents 63-64\n"
     "/volume2/@iSCSI/LUN/THIN…lun2_00000: LUN 2: 47-48: mapped synced, pool 32, extents 63-64\n"
     "5376 entries in 3 maps: 2 matches of 4 entries\n\"lid\":2,\"first\":0\n", ""},
    {"find counts one", "epinspect find one --extent 0x3; epinspect find x --extent 13", 0,
     "1 entry in 1 map: 0 matches of 0 entries\nx: 3: mapped, …\n7 entries in 1 map: 1 match of 1 entry\n", ""},
    {"find reads addresses both ways and passes over holes",
     "epinspect find pools a --extent 0-5 --pool 0; epinspect find pools --extent 5 | head -n 1", 0,
     "pools: 3: mapped, pool 0, extent 5\npools: 6: unmapped, pool 0, extent 5\n"
     "a: 0-5: mapped, pool 0, extents 0-5\n16 entries in 2 maps: 3 matches of 8 entries\n"
     "pools: 1: mapped, pool 1, extent 281474976710661 (extent 5 where bits 48 to 51 belong to the pool alone)\n", ""},
    {"find writes matches as JSON", "epinspect find pools gone --json --pool 1 --extent 5-281474976710660", 1,
     R"({"kind":"match","file":"pools","first":0,"count":1,"entryOffset":24576,"extentAddress":281474976710660,)"
     R"("poolNumber":1,"mapped":true,"vpushed":false,"vpulled":false,"synced":false}
{"kind":"match","file":"pools","first":1,"count":1,"entryOffset":24584,"extentAddress":281474976710661,"poolNumber":1,)"
     R"("mapped":true,"vpushed":false,"vpulled":false,"synced":false,"addressBits":48}
{"kind":"error","file":"gone",…}
{"kind":"summary","file":null,"summary":true,"files":1,"entries":7,"matches":2,"matchedEntries":2,"changed":[]}
)", "epinspect: gone: …\n"},
    {"check is silent on a sound store", "epinspect check --root store", 0, "11 files, 5376 entries, 0 findings\n"
     "Snapshot: …: LUN 3: shares 160 entries with its parent LUN 1, …\n", ""},
    {"check finds every fault once", "epsample --broken broken; epinspect check --root broken --json >all; status=$?;"
     R"(sed -E 's/^.*"rule"/"rule"/; s,/[^ "]*/(THIN.{36})?,,g; s/,"message/\n&/' all; exit $status)", 3,
R"("rule":"kind","stored":3,"found":"fri"
,"message":"EP_FRI: kind: type 3, a data file, but named like a free-index file"}
"rule":"data-start","stored":"0x4000","found":24576
,"message":"EP_DAT_00000: data-start: 0x4000, inside the header block of 24576 bytes"}
"rule":"serial-number","stored":7,"found":1
,"message":"EP_DAT_00001: serial-number: 7 stored, the name says 1"}
"rule":"total-count","stored":16,"found":15,"lid":1
,"message":"total-count_00000: LUN 1: total-count: 16 stored, 15 entries found"}
"rule":"mapped-count","stored":13,"found":12,"lid":2
,"message":"mapped-count_00000: LUN 2: mapped-count: 13 stored, 12 mapped entries found"}
"rule":"sync-count","stored":7,"found":8,"lid":3
,"message":"sync-count_00000: LUN 3: sync-count: 7 stored, 8 synced entries found"}
"rule":"pool-count","stored":1025,"found":1024,"lid":4
,"message":"pool-count_00000: LUN 4: pool-count: 1025 stored, SEG[0] holds at most 1024"}
"rule":"partial-entry","stored":24708,"found":4,"lid":5
,"message":"partial-entry_00000: LUN 5: partial-entry: the file of 24708 bytes ends inside entry 16, 4 of its 8 bytes )"
     R"(are there"}
"rule":"unmapped-bits","stored":"0x6c","found":"0x0","lid":6,"entries":1,"runs":1,"first":12,"count":1
,"message":"unmapped-bits_00000: LUN 6: unmapped-bits: entry 12: unmapped, but holds 0x6c"}
"rule":"address-bits","stored":"0x9011000000000073","found":"0x1","lid":7,"entries":1,"runs":1,"first":3,"count":1
,"message":"address-bits_00000: LUN 7: address-bits: entry 3: 0x9011000000000073, of which bits 48 to 51 are 0x1: )"
     R"(they count in extent address and pool number"}
"rule":"missing-data-file","stored":67108995,"found":"no EP_DAT_00001","lid":8,"entries":1,"runs":1,"first":3,"count":1
,"message":"missing-data-file_00000: LUN 8: missing-data-file: entry 3: extent 67108995, but there is no EP_DAT_00001"}
"rule":"beyond-data-file","stored":1024,"found":1024,"lid":9,"entries":1,"runs":1,"first":3,"count":1
,"message":"beyond-data-file_00000: LUN 9: beyond-data-file: entry 3: extent 1024, past the end of EP_DAT_00000, )"
     R"(which holds 1024 extents"}
"rule":"lun-size","stored":1048576,"found":1114112,"lid":11
,"message":"lun-size_00000: LUN 11: lun-size: 16 entries of 65536 bytes are 1048576 bytes, the LUN has 1114112"}
"rule":"missing-map","stored":"LUN 12","found":"no file","lid":12
,"message":"missing-map_00000: LUN 12: missing-map: no file, but this LUN needs it"}
"rule":"missing-file","stored":"LUN 14","found":"no file","lid":14
,"message":"EP_FRI: LUN 14: missing-file: no file, but this LUN and 1 other need it"}
"rule":"version","stored":1,"found":33752069
,"message":"EP_JNL: version: 1, most files have 33752069"}
"rule":"magic","stored":"0x0","found":"0x1122334455667788"
,"message":"EP_TBL: magic: 0x0, most files have 0x1122334455667788"}
"rule":"shared-extents","stored":162,"found":"shared-extents_00000","lid":10,"otherLid":10,"entries":1,"runs":1,)"
     R"("first":3,"count":1,"otherFile":"shared-extents_00000","otherFirst":2
,"message":"shared-extents_00000: LUN 10: shared-extents: entry 3: pool 16, extent 162, used by entry 2 of this map )"
     R"(too"}
"rule":"extent-size","stored":131072,"found":65536,"lid":13
,"message":"EP_TBL: LUN 13: extent-size: 131072 stored, the LUN has 65536"}
"rule":"same-map","stored":"LUN 15","found":"LUN 14","lid":15,"otherLid":14
,"message":"same-map_00000: LUN 15: same-map: LUN 14 has this map file too"}
{"kind":"summary","file":null,"summary":true,"files":26,"entries":207,"findings":20,"rules":{"kind":1,"data-start":1,)"
     R"("magic":1,"version":1,"total-count":1,"mapped-count":1,"sync-count":1,"pool-count":1,"partial-entry":1,)"
     R"("unmapped-bits":1,"address-bits":1,"missing-data-file":1,"beyond-data-file":1,"shared-extents":1,)"
     R"("serial-number":1,"lun-size":1,"extent-size":1,"missing-map":1,"same-map":1,"missing-file":1},)"
     R"("notCompared":["missing-data-file, beyond-data-file: entries with bits 48 to 51 set: address-bits_00000"],)"
     R"("changed":[],"snapshots":[]}
)", ""},
    {"check multiplies in 64 bits", "epsample s; printf '\\0\\20\\0\\0\\0\\20' | dd of=$(echo "
     "s/volume1/*/LUN/*lun1_00000) bs=1 "
     "seek=76 conv=notrunc status=none; epinspect check --root s", 3,
     "…: lun-size: 17592186048512 entries of 1048576 bytes are more than 18446744073709551615 bytes, the LUN has …\n"
     "…: total-count: 17592186048512 stored, 4096 entries found\n…2 findings: …\n", ""},
    {"check compares maps that are named with their LUNs and tables", "epsample --broken broken; "
     "epinspect check --root broken broken/volume2/*/LUN/*lun-size* broken/volume3/@iSCSI/LUN/*", 3,
     "broken/…lun-size_00000: LUN 11: lun-size: 16 entries of 65536 bytes are 1048576 bytes, the LUN has 1114112\n"
     "/volume3/@iSCSI/EP/EP_TBL: LUN 13: extent-size: 131072 stored, the LUN has 65536\n"
     "2 files, 32 entries, 2 findings: 1 lun-size, 1 extent-size\n", ""},
    {"check finds extents that are shared", "epinspect check late y x ./x other/x large", 3,
     "late: data-start: 0x6001, past the end of the file, which has 24576 bytes\n"
     "x: unmapped-bits: entry 6: unmapped, but holds 0x100000000000c\n"
     "x: address-bits: entry 6: 0x100000000000c, of which bits 48 to 51 are 0x1: they count in extent address and pool "
     "number\n"
     "x: shared-extents: 2 entries in 2 runs, first entry 2: pool 0, extent 12, used by entry 0 of y too\n"
     "x: shared-extents: entry 5: pool 0, extent 11, used by entry 1 of this map too\n"
     "5 files, 20012 entries, 5 findings: 1 data-start, 1 unmapped-bits, 1 address-bits, 2 shared-extents\n"
     "Not compared: …the extent size is not known, give --extent-size: …shared-extents: maps in different folders "
     "whose paths name no volume\n", ""},
    {"check names each map that shares", "epinspect check first second both", 3,
     "both: shared-extents: entries 0-1: pool 0, extents 50-51, used by entries 0-1 of first too; …\n"
     "both: shared-extents: entries 2-3: pool 0, extents 52-53, used by entries 2-3 of second too; …\n…", ""},
    {"check joins what two maps share", "epinspect check there back --json | sed -n '1s/.*\"entries/\"entries/p';"
     " epinspect check there back --each | grep -c ' too$'", 0,
     R"("entries":3,"runs":2,"first":0,"count":1,"otherFile":"there","otherFirst":2,"message":"back: shared-extents: )"
     "3 entries in 2 runs, first entry 0: pool 0, extent 30, used by entry 2 of there too\"}\n2\n", ""},
    {"check looks into data files", "epinspect check --root . --extent-size 1M", 3,
     "/volume1/@iSCSI/LUN/m: beyond-data-file: entry 1: extent 4194303, past the end of EP_DAT_00000, which holds "
     "4194303 extents\n"
     "/volume1/@iSCSI/LUN/m: missing-data-file: entry 5: extent 8388608, but there is no EP_DAT_00002\n"
     "/volume1/@iSCSI/LUN/m: missing-data-file: entry 6: extent 8796093022207, but there is no EP_DAT_2097151\n"
     "/volume1/@iSCSI/LUN/m: missing-data-file: entry 7: extent 8796093022208, but there is no data file\n"
     "/volume1/@iSCSI/LUN/m: beyond-data-file: entries 3-4: extent 4194305 and others, past the end of "
     "EP_DAT_00001, which holds 1 extent\n"
     "3 files, 8 entries, 5 findings: 3 missing-data-file, 2 beyond-data-file\n"
     "Not compared: lun-size, extent-size, missing-map, missing-file: no LUN with an id from 0 to 255 is known\n",
     "…LUN 0-255: none is known: The LUN list ./var/db/iscsi/luns.json is missing or cannot be read: No such file or "
     "directory (code 9002)\n"},
    {"check writes findings as JSON", "epinspect check x y --json | sed -n 3p", 0,
     R"({"kind":"finding","file":"x","rule":"shared-extents","stored":11,"found":"x","entries":1,"runs":1,"first":5,)"
     R"("count":1,"otherFile":"x","otherFirst":1,"message":"x: shared-extents: entry 5: pool 0, extent 11, used by )"
     R"(entry 1 of this map too"}
)", ""},
    {"check says what it could not compare", "epsample s; cd s; sed -i 's,/volume2,/share,;"
     " s/lun1\"/new\"/' var/db/iscsi/luns.json;"
     "rm volume1/*/EP/EP_TBL volume2/*/EP/EP_DAT*; truncate -s 99 volume1/*/EP/EP_DAT_00001;"
     " mkfifo volume2/@iSCSI/EP/EP_DAT_00000; epinspect check --root . --extent-size 1M", 1,
     "/volume1/@iSCSI/EP/EP_TBL: LUN 1: missing-file: no file, but this LUN and 1 other need it\n"
     "/volume1/@iSCSI/LUN/BLUN…new_00000: LUN 1: missing-map: no file, but this LUN needs it\n"
     "/share/@iSCSI/LUN/THIN…lun2_00000: LUN 2: missing-map: no file, but this LUN needs it\n"
     "8 files, 5376 entries, 3 findings: 2 missing-map, 1 missing-file\nSnapshot: …\n"
     "Not compared: beyond-data-file: a data file cannot be read: /volume1/… and 2 more\n"
     "Not compared: extent-size: no table file that can be compared: /volume1/@iSCSI/EP/EP_TBL and 1 more\n"
     "Not compared: extent-size: the path of the LUN's map file names no volume: /share/…\n"
     "Not compared: lun-size, extent-size: no LUN with an id from 0 to 255 is known for this map: /volume1/… and 1 "
     "more\n",
     "epinspect: /volume1/@iSCSI/EP/EP_DAT_00001: ends too early (EP_ERR_READ_FAILED, 18990039)\n"
     "epinspect: /volume2/@iSCSI/EP/EP_DAT_00000: cannot be opened: neither a regular file nor a block device "
     "(EP_ERR_OPEN_FAILED, 18990038)\n"},
    {"check says what named files lack", "cd p; >volume1/@iSCSI/EP; epinspect check --root . EP_DAT_7x x "
     "volume1/@iSCSI/LUN/* --extent-size 1M", 1,
     "volume1/@iSCSI/LUN/t: kind: type 1, but named like a map file\n"
     "EP_DAT_7x: magic: 0x9, most files have 0x1122334455667788\n"
     "4 files, 2 entries, 2 findings: 1 kind, 1 magic\n"
     "Not compared: all other rules for a map file: the type is another: volume1/@iSCSI/LUN/t\n"
     "Not compared: kind: the file's name does not say which: x\n"
     "Not compared: lun-size, extent-size: no LUN with an id from 0 to 255 is known for this map: x and 1 more\n"
     "Not compared: missing-data-file, beyond-data-file: the data files of the volume cannot be listed: "
     "volume1/@iSCSI/LUN/m\n"
     "Not compared: missing-data-file, beyond-data-file: the path names no volume: x\n"
     "Not compared: serial-number: not a name that the target gives to a data file: EP_DAT_7x\n"
     "Not compared: version: no value that most files have\n",
     "epinspect: /volume1/@iSCSI/EP/: cannot be opened: Not a directory (EP_ERR_OPEN_FAILED, 18990038)\n"},
    {"diff and find say that a map became shorter",
     "for what in 'diff --entries s none' 'find s --pool 0'; do cp scattered s; { epinspect $what; echo $?; } |"
     " { read first; truncate -s 90000 s; tail -n 1; }; done", 0, "1\n1\n", shorter + shorter},
    {"diff and find and check name what is wrong",
     "epinspect diff gone other; epinspect diff gone one; epinspect diff a; epinspect find a;"
     " epinspect check --extent-size 0", 2, "",
     "epinspect: A and B must both be files, or both be folders. Try 'epinspect diff --help'.\n"
     "epinspect: gone: cannot be opened: No such…epinspect: B is missing. Try 'epinspect diff --help'.\n"
     "epinspect: --extent or --pool is missing. Try…"
     "epinspect: --extent-size: '0': must not be 0. Try 'epinspect check --help'.\n"},
};
// clang-format on

}  // namespace

TEST_P(Check, Promises) { expect(GetParam()); }
INSTANTIATE_TEST_SUITE_P(, Check, testing::ValuesIn(cases), nameOf);
