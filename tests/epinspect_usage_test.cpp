// epinspect usage and owner: who uses the space of a volume, and whose bytes lie at a position of a data file.
#include "ProgramTest.h"

namespace {

namespace head0 = epbuilder::head0;
namespace map = epbuilder::map;

constexpr std::uint64_t m = 0x8000000000000000, ambiguous = 0x0001000000000000, pool16 = 0x0010000000000000;
const std::string luns = "/volume7/@iSCSI/LUN/", dat = "/volume7/@iSCSI/EP/EP_DAT_0000";

EPFileBuilder mapOf(const std::vector<std::uint64_t>& entries) {
    std::string content;
    for (const std::uint64_t entry : entries) content += epbuilder::littleEndian(entry, 8);
    return EPFileBuilder::map().bytes(24576, content);
}

/// On volume 7 LUNs 1, 2 and 4 of extents of 1000003 bytes, which do not divide 4 TiB: 4398034 start in the first data
/// file, which holds 3 and a half, and more in the second one, which holds 2.
class Usage : public ProgramTest {
protected:
    Usage() {
        expect(
            {"",
             "mkdir -p r/var/db/iscsi; for l in 1 2 4; do printf '{\"lid\":%s,\"extentSize\":1000003,\"size\":9000027,"
             "\"restoreTime\":0,\"type\":7,\"uuid\":\"\",\"rootPath\":\"/volume7\",\"name\":\"%s\"}' $l $l; done | "
             "sed 's/}{/},{/g; s/.*/[&]/' >r/var/db/iscsi/luns.json",
             0, "", ""});
        EPFileBuilder data = EPFileBuilder::data();
        write("r" + dat + "0", data.resize(24576 + 3500010));
        write("r" + dat + "1", data.resize(24576 + 2000006));
        write("r" + luns + "THIN1_00000", mapOf({m, m + 1, m + 1, m + 3, m + first1, 0, 5, m + first1 + 2}));
        write("r" + luns + "THIN2_00000", mapOf({m + pool16 + 1, m + 2, m + first1 + 1, m + first1}));
        write("r" + luns + "THIN4_00000", mapOf({m + ambiguous + 2}));
        std::vector<std::uint64_t> one, other;  // 25000 stretches of the volume, and three extents in common
        for (std::uint64_t i = 0; i < 25000; ++i) {
            one.push_back(m + (i << 16U));
            other.push_back(m + (i << 16U) + (i < 3 ? 0 : 1));
        }
        write("edge", mapOf({m + 34093383807, m + 34093383808}));  // of 129 bytes: the last extent to start in 4 TiB
        write("far", mapOf({m, m + (std::uint64_t{1} << 47U), m + (std::uint64_t{1} << 47U) + 1}));
        std::vector<std::uint64_t> longRun, longer;
        for (std::uint64_t i = 0; i < 50000; ++i) {
            longRun.push_back(m + 100 + i);
            longer.push_back(m + 100 + i % 40000 + (i < 40000 ? 0 : 100000));
        }
        write("long", mapOf(longRun));
        write("longer", mapOf(longer));
        write("wide" + luns + "one", mapOf(one));
        write("wide" + luns + "other", mapOf(other));
    }

    static constexpr std::uint64_t first1 = 4398034;
};

const std::string of = "epinspect --root r ", at0 = of + "owner " + dat + "0 ", at1 = of + "owner " + dat + "1 ";
const std::string left = luns + "THIN4_00000: 1 mapped entry left out: bits 48 to 51 are set, --address-bits decides";
const std::string decides = luns +
                            "THIN4_00000: entry 0: may be an owner: bits 48 to 51 are set: extent 2 of pool 1 "
                            "with --address-bits 48, extent 281474976710658 of pool 0 with --address-bits 52 "
                            "(EP_ERR_NO_PATH, 18990401)";
const std::string withinFile =
    "assumed: entry i holds bytes from i x extent size; extents counted within the data file "
    "(counted from the volume's start they would lie past its end)\n";
const std::string assumed = "assumed: entry i holds bytes from i x extent size\n";

// clang-format off
const Case cases[] = {
    {"shows what each LUN has alone, and what of each data file is in use", of + "usage", 0,
     "/volume7, extents of 1000003 bytes\n"
     "              entries   mapped    extents    alone    shared\n"
     "LUN 1               8        6          5        3         2\n"
     "              7.6 MiB  5.7 MiB    4.8 MiB  2.9 MiB   1.9 MiB\n"
     "LUN 2               4        4          4        2         2\n"
     "              3.8 MiB  3.8 MiB    3.8 MiB  1.9 MiB   1.9 MiB\n"
     "LUN 4               1        1          0        0         0\n"
     "              977 KiB  977 KiB        0 B      0 B       0 B\n"
     "                holds   in use  unclaimed   shared  past end\n"
     "EP_DAT_00000        3        3          0        1         1\n"
     "              2.9 MiB  2.9 MiB        0 B  977 KiB   977 KiB\n"
     "EP_DAT_00001        2        2          0        1         1\n"
     "              1.9 MiB  1.9 MiB        0 B  977 KiB   977 KiB\n"
     "3 maps, 2 data files: 11 entries mapped, 7 extents in use, 2 shared by several\nmaps\n", says({left})},
    {"writes exact bytes, of the maps that are named, beside what all others use",
     of + "usage 2 --address-bits 48 --json", 0,
     R"({"kind":"lunUsage","file":")" + luns + R"(THIN2_00000","lid":2,"extentSize":1000003,"entries":4,)"
     R"("entriesBytes":4000012,"mapped":4,"mappedBytes":4000012,"ambiguous":0,"extents":4,"extentsBytes":4000012,)"
     R"("alone":1,"aloneBytes":1000003,"shared":3,"sharedBytes":3000009})" "\n"
     R"({"kind":"dataFileUsage","file":")" + dat + R"(0","extentSize":1000003,"extents":3,"extentsBytes":3000009,)"
     R"("used":3,"usedBytes":3000009,"shared":2,"sharedBytes":2000006,"unclaimed":0,"unclaimedBytes":0,"beyond":1,)"
     R"("beyondBytes":1000003})" "\n" R"({"kind":"dataFileUsage",…"used":2,…"shared":1,…"beyond":1,…})" "\n"
     R"({"kind":"summary","file":null,"summary":true,"maps":1,"dataFiles":2,"mapped":4,"extents":4,"shared":3,)"
     R"("changed":[]})" "\n", ""},
    {"is not sure where a map cannot be read", "rm r" + luns + "THIN1*; " + of + "usage 2; " +
     of + "usage --json | grep -o 'lid\":[0-9]*,\"e\\|alone[^,]*,\\|unclaimed[^,]*,\\|"
     "shared\":0,\"sharedAtLeast\":0,\"ch' | LC_ALL=C sort -u", 0,
     "…LUN 2               4                 4                4        at most 4    at least 0\n…"
     "EP_DAT_00000        3        at least 2        at most 1 …, at least 0 shared by\nseveral maps\n"
     "alone\":null,\naloneAtMost\":0,\naloneAtMost\":4,\naloneBytes\":null,\n"
     "lid\":2,\"e\nlid\":4,\"e\nshared\":0,\"sharedAtLeast\":0,\"ch\n"
     "unclaimed\":null,\nunclaimedAtMost\":0,\nunclaimedAtMost\":1,\nunclaimedBytes\":null,\n",
     "epinspect: " + luns + "THIN1_00000: cannot be opened: No such file or directory (EP_ERR_OPEN_FAILED, 18990038)\n"
     "…"},
    {"counts a map of several names once, by the name that a LUN has",
     "ln -s THIN2_00000 r" + luns + "A; ln r" + luns + "THIN2_00000 r" + luns + "Z; rm r" + luns + "THIN[14]*; " +
     of + "usage --json --luns 2-2 | grep -o '\"lid\":.*\"alone\":[0-9]*\\|maps\":[0-9]*'", 0,
     "\"lid\":2,…\"alone\":4\nmaps\":1\n", says({luns + "THIN2_00000: the same file as " + luns +
     "A, which counts once",
     luns + "Z: the same file as " + luns + "THIN2_00000, which counts once"})},
    {"counts extents of another size, and of an unknown one, apart", "cp r" + luns + "THIN1_00000 r" + luns + "M; "
     "sed -i 's/1000003/4096/' r/var/db/iscsi/luns.json; " + of + "usage | grep /volume7,; " +
     of + "usage --extent-size 4K | grep -A 1 'LUN 1\\|unclaimed' | head -n 5", 0,
     "/volume7, extents of unknown size\n/volume7, extents of 4096 bytes\n/volume7, extents of 1000003 bytes\n"
     "LUN 1 …8 …6 …5 …0 …5\n…\n…unclaimed…\nEP_DAT_00000 …854 …3 …at most 851 …\n--\n",
     "epinspect: " + luns + "M: extent size not known, give --extent-size: …volume7: extents of different sizes are "
     "counted apart: 4096, 1000003 bytes\n…"},
    {"counts stretches of the volume as single extents", "cp long* r" + luns + "; for c in check usage; do "
     "epinspect --root r $c /volume7/@iSCSI/LUN/long /volume7/@iSCSI/LUN/longer --extent-size 4K --json 2>err; done | "
     "grep -o '\"found\":\"/.*first\":[0-9]*\\|\"alone\":[0-9]*\\|\"used\":7[0-9]*\\|\"beyond\":[1-9][0-9]*'", 0,
     R"("found":"/volume7/@iSCSI/LUN/long","entries":40000,"runs":1,"first":0)" "\n"
     "\"alone\":10000\n\"alone\":10000\n\"used\":754\n\"beyond\":59246\n…", ""},
    {"counts apart where the LUN's extent size is 0", "sed -i 's/1000003/0/' r/var/db/iscsi/luns.json; " + of +
     "usage | head -n 3; " + at0 + "24580", 1,
     "/volume7, extents of unknown size\n       entries  mapped  extents …\n"
     "LUN 1        8       6        5  at most 5  at least 0\n"
     "24580: no map that could be read uses this\n" + assumed,
     says({"LUN 1: extent size cannot be used (EP_ERR_BAD_EXTENT_SIZE, 18990507)", left,
           "LUN 1: extent size cannot be used (EP_ERR_BAD_EXTENT_SIZE, 18990507)"})},
    {"takes an extent for that of the data file it starts in", "cp edge r/volume7/x; "
     "epinspect --root r locate /volume7/x 0 129 --extent-size 129 --json 2>err | "
     "grep -o 'file\",\"dataFile[^,]*,\"extent\":[0-9]*'", 0,
     "file\",\"dataFile\":\"" + dat + "0\",\"extent\":34093383807\nfile\",\"dataFile\":\"" + dat +
     "1\",\"extent\":0\n", ""},
    {"divides a run between two data files", "rm r" + luns + "*; cp edge r" + luns + "; " + of +
     "usage --extent-size 1 2>err | head -n 1; " + of + "usage --extent-size 129 2>err | grep ^EP | head -n 2", 0,
     "/volume7, extents of 1 byte\n"
     "EP_DAT_00000    27131       0    at most 27131       0         1\n"
     "EP_DAT_00001    15503       1    at most 15502       0         0\n", ""},
    {"counts a map that is alone on its volume", "mkdir -p one/volume3/@iSCSI/LUN; cp far one/volume3/@iSCSI/LUN; "
     "epinspect --root one usage --extent-size 4K | head -n 1", 0, "/volume3, extents of 4096 bytes\n", "…"},
    {"reports a data file that is missing", "rm r" + dat + "1; " + of + "usage 2 >out; echo $?; grep DAT_00001 out", 0,
     "1\nEP_DAT_00001  unknown        3    unknown        1   unknown\n",
     says({dat + "1: cannot be opened: No such file or directory (EP_ERR_OPEN_FAILED, 18990038)"})},
    {"counts what is shared where memory does not last for the extents of all maps",
     "epinspect --root wide usage --extent-size 4K --json | grep -o 'alone\":[0-9]*\\|\"shared\":[0-9]*,\"s'", 0,
     "alone\":24997\n\"shared\":3,\"s\nalone\":24997\n\"shared\":3,\"s\n\"shared\":3,\"s\n\"shared\":0,\"s\n", "…"},
    {"leaves out what the target calls no data file", "for n in 0001 2097152; do cp r" + dat + "0 r/volume7/@iSCSI/EP/"
     "EP_DAT_$n; done; " + of + "usage 2 | tail -n 2", 0, "1 map, 2 data files: …\n", "…" + says({
     "/volume7/@iSCSI/EP/EP_DAT_2097152: not a data file of the target, left out",
     "/volume7/@iSCSI/EP/EP_DAT_0001: not a data file of the target, left out"})},
    {"finds no EP file", "mkdir none; epinspect --root none usage; epinspect --root none owner " + dat + "0 5", 1,
     "0 maps, 0 data files: 0 entries mapped, 0 extents in use, 0 shared by several\nmaps\n",
     "…none: no EP files found (EP_ERR_NO_PATH, 18990401)\nepinspect: " + dat + "0: cannot be opened: No such …\n"},
    {"draws what is free, in use and shared", "LC_ALL=C COLUMNS=20 " + of + "usage 2 --chart 2>err | tail -n 18", 0,
     "…" + dat + "0\n0 |#S#|\nOne cell: 1 extent\n" + dat + "1\n0 |S#|\nOne cell: 1 extent\nIn use: . none\n"
     "        - <1/3\n"
     "        + <2/3\n        * most\n        # all\n        S some shared\n1 map, …", ""},
    {"draws extents that lie far apart", "mkdir wide/volume7/@iSCSI/EP; cp r" + dat + "0 wide" + dat + "0; "
     "large truncate -s 4T wide" + dat + "0; LC_ALL=C COLUMNS=60 epinspect --root wide usage --extent-size 512 "
     "--chart 2>err | sed -n '/EP_DAT_00000$/,$p' | grep -v '|[.]*|$'", 0,
     dat + "0\n         0 |S----------------------------------------------|\n"
     " 536870942 |-----------------------------------------------|\n"
     "1073741884 |-----------------------------------------------|\n"
     "1610612826 |---............................................|\nOne cell: 11422786 extents\n…", ""},
    {"compares a map from elsewhere on the volume", "cp r" + luns + "THIN2_00000 r/volume7/y; cp r" + luns +
     "THIN2_00000 r/z; for m in volume7/y z; do " + of + "usage /$m --extent-size 1000003 | grep -A 1 '^/.*[yz]$'; "
     "done", 0,
     "/volume7/y\n                    4        4          4        0         4\n"
     "/z\n        4        4        4        at most 4    at least 0\n", says({"/z: its path names no volume: "
     "which other maps share its extents is not known (EP_ERR_NO_PATH, 18990401)"})},

    {"names every owner of a byte, and no other", at0 + "24575 1024579 1024578 3024585 2024582", 1,
     "24575: header block, before the first extent\n"
     "1024579: LUN 1 byte 1000003: entry 1, byte 0 of its extent: mapped, pool 0, extent 1\n"
     "1024579: LUN 1 byte 2000006: entry 2, byte 0 of its extent: mapped, pool 0, extent 1\n"
     "1024579: LUN 2 byte 0: entry 0, byte 0 of its extent: mapped, pool 16, extent 1\n"
     "1024578: LUN 1 byte 1000002: entry 0, byte 1000002 of its extent: mapped, pool 0, extent 0\n"
     "3024585: LUN 1 byte 3000009: entry 3, byte 0 of its extent: mapped, pool 0, extent 3\n"
     "2024582: LUN 2 byte 1000003: entry 1, byte 0 of its extent: mapped, pool 0, extent 2\n" + assumed,
     says({decides})},
    {"divides a range by its owners, past the end too", at1 + "24570-3024584 --address-bits 48", 1,
     "24570-24575: header block, before the first extent\n"
     "24576-1024578: LUN 1 bytes 4000012-5000014: entry 4, from byte 0 of its extent: mapped, pool 0, extent 4398034\n"
     "24576-1024578: LUN 2 bytes 3000009-4000011: entry 3, from byte 0 of its extent: mapped, pool 0, extent 4398034\n"
     "1024579-2024581: LUN 2 bytes 2000006-3000008: entry 2, from byte 0 of its extent: mapped, pool 0, extent "
     "4398035\n"
     "2024582-3024584: LUN 1 bytes 7000021-8000023: entry 7, from byte 0 of its extent: mapped, pool 0, extent "
     "4398036\n" +
     withinFile, says({dat + "1: position 2024582: past the end, the file holds 2024582 bytes (EP_ERR_READ_FAILED, "
     "18990039)"})},
    {"writes owners as JSON", at1 + "24580 --json --extent-size 500 --count-from volume; " +
     at0 + "1024580-1024581 --json --address-bits 52", 0,
     R"({"kind":"position","file":")" + dat + R"(1","position":24580,"length":1,"where":"extent","owners":[]})" "\n"
     R"({"kind":"position","file":")" + dat + R"(0","position":1024580,"length":2,"where":"extent",)"
     R"("owners":[{"countFrom")"
     R"(:"file","map":")" + luns + R"(THIN1_00000","lid":1,"index":1,"remainder":1,"lunOffset":1000004,)"
     R"("extentAddress":1,)"
     R"("poolNumber":0,"mapped":true,"vpushed":false,"vpulled":false,"synced":false,"undecided":false},{…,"lid":1,)"
     R"("index":2,…},{…,"lid":2,"index":0,…}]})" "\n", ""},
    {"writes positions as JSON that lie in no extent", at1 + "24575-24576 2024581-2024583 --json 2>err | grep -o "
     "'\"position\":[^[]*'", 0,
     R"("position":24575,"length":1,"where":"header","owners":)" "\n"
     R"("position":24576,"length":1,"where":"extent","owners":)" "\n"
     R"("position":2024581,"length":1,"where":"extent","owners":)" "\n"
     R"("position":2024582,"length":2,"where":"past-end","owners":)" "\n", ""},
    {"counts what has no place in the data files", "large truncate -s 5T r" + dat + "1; " + of + "usage 2 >out; "
     "cp far r" + luns + "; for s in '' '--extent-size 64K'; do " + of + "usage " + luns + "far $s --json | "
     "grep lunUsage; done", 0,
     R"({"kind":"lunUsage",…,"extentSize":null,"entries":3,"entriesBytes":null,"mapped":3,…,"extents":3,…})" "\n"
     R"({"kind":"lunUsage",…,"extentSize":65536,…})" "\n", "epinspect: " + dat + "1: larger than its part of the "
     "volume: extents may be counted from the volume's start, these figures count within the file\n"
     "…epinspect: /volume7: 2 extents in use end past byte 2^63 of the volume (EP_ERR_SEEK_FAILED, 18990041)\n…"},
    {"leaves undecided from where extents are counted", "large truncate -s 5T r" + dat + "1; " + at1 +
     "24577 --address-bits 48; " +
     at1 + "4398047218679 --address-bits 48; " + at1 + "24577 --address-bits 48 --count-from volume", 0,
     "24577: LUN 1 byte 4000013: entry 4, byte 1 of its extent: mapped, pool 0, extent 4398034, if extents are counted "
     "within the data file\n24577: LUN 2 byte …\n"
     "assumed: …; ambiguous: by both ways of counting extents lie inside the "
     "data file, --count-from decides\n"
     "4398047218679: LUN 1 byte …: entry 4, byte …, if extents are counted from the volume's start\n…LUN 2 …\n"
     "assumed: …\n"
     "24577: no map uses this\nassumed: entry i holds bytes from i x extent size; extents counted from the volume's "
     "start, as --count-from says\n", ""},
    {"counts nothing from the volume's start that would lie past the end", "large truncate -s 4398048218681 r" + dat +
     "1; " + at1 + "4398048218680-4398048218690 --address-bits 48", 1,
     "4398048218680: LUN 1 byte 5000014: …\n4398048218680: LUN 2 byte 4000011: …start\nassumed: …\n",
     says({dat + "1: position 4398048218681: past the end, the file holds 4398048218681 bytes (EP_ERR_READ_FAILED, "
     "18990039)"})},
    {"is not sure of owners where a map cannot be read", "truncate -s 99 r" + luns + "THIN1*; " + at1 + "1999999;"
     "rm r" + luns + "THIN2*; " + at1 + "1999999", 1,
     "1999999: LUN 2 byte …\n…1999999: no map that could be read uses this\n…", "…ends too early…No such file…"},
    {"takes a data file of a volume alone", "cp r" + dat + "0 r/x; ln -s EP_DAT_00000 r" + dat + "2; for f in r/x " +
     luns +
     "THIN1_00000 " + dat + "3; do " + of + "owner $f 0; done; " + at0 + "9223372036854775808; " + at0 + "5-4", 2, "",
     "epinspect: r/x: its path names no volume (…)\nepinspect: " + luns + "THIN1_00000: not a name that the target "
     "gives to "
     "a data file (…)\nepinspect: " + dat + "3: cannot be opened: No such …)\n"
     "epinspect: POSITION: '9223372036854775808': "
     "number out of range. Try …\nepinspect: POSITION: '5-4': range runs backwards. Try …\n"},
};
// clang-format on

}  // namespace

TEST_P(Usage, Promises) { expect(GetParam()); }
INSTANTIATE_TEST_SUITE_P(, Usage, testing::ValuesIn(cases), nameOf);
