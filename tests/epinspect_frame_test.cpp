// epinspect extent, lun and path, and what holds for all subcommands: usage, streams, --root.
#include "ProgramTest.h"

namespace {

class Frame : public ProgramTest {
protected:
    Frame() {
        write("data", EPFileBuilder::data().bytes(24576, "extent 0extent 1ext"));
        write("early", EPFileBuilder::data().set(epbuilder::head0::dataStartOffset, 24568));
        write("late", EPFileBuilder::data().set(epbuilder::head0::dataStartOffset, 24577));
        write("EP_TBL", EPFileBuilder::table());
        std::ofstream(path("luns.json"))
            << R"([{"lid": 7, "extentSize": 4096, "size": 8192, "restoreTime": 5, "type": -2, "uuid": "u-7",
            "rootPath": "/volume3", "name": "c\u0007\"d"}, {"lid": 9, "name": 1}, {"lid": 8, "extentSize": 0,
            "size": 0, "restoreTime": 0, "type": 0, "uuid": "", "rootPath": "", "name": ""}])";
    }
};

const std::string map1 = "/volume1/@iSCSI/LUN/BLUN6f1c1d0a-58d3-4e0f-9b51-2f7a9c5e0d11lun1_00000";
const std::string map2 = "/volume2/@iSCSI/LUN/THIN0b9d2f64-7c1e-4a55-8a3b-90c4d7e6f522lun2_00000";
const std::string data0 = "store/volume1/@iSCSI/EP/EP_DAT_00000";
const std::string noLun = ": configuration cannot be loaded: ", noSuchLun = noLun + "No such LUN (code 9001)";
const std::string leadsOut =
    ": cannot be opened: a link leads out of the folder of --root (EP_ERR_OPEN_FAILED, 18990038)";

/// Wrong usage, what is wrong with it, and the subcommand whose help is recommended.
Case usage(const std::string& arguments, const std::string& complaint, const char* subcommand) {
    return {"complains about " + arguments, "epinspect " + arguments, 2, "",
            says({complaint + ". Try 'epinspect" + subcommand + " --help'."})};
}

// clang-format off
const Case cases[] = {
    {"shows extents", "epinspect extent data 1 --extent-size 8; epinspect extent data 0 --extent-size 8 --raw", 0,
     "657874656e742031\nextent 0", ""},
    {"shows large extents whole", "d=" + data0 + "; epinspect extent $d 1 --extent-size 600K --raw >raw; "
     "tail -c +638977 $d | head -c 614400 | cmp - raw; { od -An -v -tx1 raw | tr -d ' \\n'; echo; } >hex; "
     "epinspect extent $d 1 --extent-size 614400 | cmp - hex", 0, "", ""},
    {"refuses extents that are not there whole", "for n in '2 --extent-size 8' '1 --extent-size 16' '0 --extent-size "
     "20' '17592186044416 --extent-size 1M' '2251799813685245 --extent-size 8K'; do epinspect extent data $n; done", 1,
     "", says({"data: extent 2" + holds("0-1"), "data: extent 1" + holds("0"), "data: extent 0" + holds("none"),
           "data: extent 17592186044416" + holds("none"), "data: extent 2251799813685245" + holds("none")})},
    {"says what is doubtful or wrong about extents", "for f in gone EP_TBL late early; do epinspect extent $f 0 "
     "--extent-size 8; done", 0, "0000000000000000\n",
     says({"gone: extent 0" + missing,
           "EP_TBL: extent 0" + wrongType, "late: data start offset 0x6001 lies past the end of the file",
           "late: extent 0" + holds("none"), "early: data start offset 0x5ff8 lies inside the header block"})},

    {"shows the configuration of a LUN", "epinspect lun 1 --root store", 0,
     "lid: 1 ,extent_size: 1048576 (1MB) ,size: 4294967296 (4GB) ,restore time: Sun Sep 13 12:28:40 UTC 2020 "
     ",type: BLUN ,uuid: 6f1c1d0a-58d3-4e0f-9b51-2f7a9c5e0d11 ,rootpath: /volume1 ,name: lun1\n" + map1 + "\n", ""},
    {"writes LUNs as JSON and passes over what does not exist", "epinspect --root store lun --json 0-2", 0,
     "{\"kind\":\"lun\",\"file\":\"" + map1 + R"(","lid":1,"extentSize":1048576,"size":4294967296,)"
     R"("restoreTime":1600000120,"type":263,"uuid":"6f1c1d0a-58d3-4e0f-9b51-2f7a9c5e0d11","rootPath":"/volume1",)"
     R"("name":"lun1","typeName":"BLUN","missing":false})" "\n"
     "{\"kind\":\"lun\",\"file\":\"" + map2 + "\",\"lid\":2,\"extentSize\":65536,\"size\":16777216,"
     R"("restoreTime":0,"type":7,"uuid":"0b9d2f64-7c1e-4a55-8a3b-90c4d7e6f522","rootPath":"/volume2","name":"lun2",)"
     R"("typeName":"THIN","missing":false})" "\n", ""},
    {"prefers the LUN list of the environment", "KELPISCSIEP_LUNS=luns.json epinspect --root store lun --json 7", 0,
     R"({"kind":"lun","file":"/volume3/@iSCSI/LUN/…","lid":7,"extentSize":4096,"size":8192,"restoreTime":5,"type":-2,)"
     R"("uuid":"u-7","rootPath":"/volume3","name":"c\u0007\"d","typeName":"…","missing":true})" "\n", ""},
    {"says which LUNs do not exist", "epinspect --root store lun 9 4-5", 1, "",
     says({"LUN 9" + noSuchLun, "LUN 4-5: none is known: No such LUN (code 9001)"})},
    {"says which LUNs of a range are broken", "KELPISCSIEP_LUNS=luns.json epinspect lun 8-10 --json", 1,
     R"(…,"lid":8,…,"type":0,…}…{"kind":"error","file":null,"lid":9,"error":null,"code":…,"message":"LUN 9: …"})" "\n",
     says({"LUN 9" + noLun + "The LUN list luns.json holds a value of the wrong type,…"})},

    {"tells where files lie", "for a in 'tbl /volume1/x' 'fri /volume2/@iSCSI/LUN/x' jnl 'jnl x' 'map 2 --root store' "
     "'dat /volume3/x --extent-size 1M --extent-address 4194303' 'dat /volume3/x --extent-size 1M --extent-address "
     "0x400000'; do epinspect path $a; done", 0,
     "/volume1/@iSCSI/EP/EP_TBL\n/volume2/@iSCSI/EP/EP_FRI\n/var/db/iscsi/EP_JNL\n/var/db/iscsi/EP_JNL\n" + map2 +
     "\n/volume3/@iSCSI/EP/EP_DAT_00000\n/volume3/@iSCSI/EP/EP_DAT_00001\n", ""},
    {"takes the volume from the path on the target", "epinspect --root store path tbl store/./volume1/x; "
     "epinspect path fri store/volume1/x; epinspect path map 1 --root .", 1, "/volume1/@iSCSI/EP/EP_TBL\n",
     says({"store/volume1/x: path names no volume (EP_ERR_NO_PATH, 18990401)",
           "LUN 1" + noLun + "The LUN list ./var/db/iscsi/luns.json is missing or cannot be read: No such file or "
           "directory (code 9002)"})},
    {"refuses extent addresses without a position", "for a in '8796093022207 --extent-size 1M' "
     "'8796093022208 --extent-size 1M' '9223372036854775808 --extent-size 1'; do "
     "epinspect path dat /volume1/x --extent-address $a; done", 1,
     "/volume1/@iSCSI/EP/EP_DAT_2097151\n",
     says({"/volume1/x: position out of any file's range (EP_ERR_SEEK_FAILED, 18990041)", "/volume1/x: position…"})},
    {"finds files below root however they are spelt", "for f in /var/db/iscsi/EP_JNL var/db/iscsi/EP_JNL "
     "store/var/db/iscsi/EP_JNL ./store//var/../var/db/iscsi/EP_JNL \"$PWD/store/var/db/iscsi/EP_JNL\"; "
     "do epinspect --root=./store// dump --json \"$f\"; done | grep -c '\"kind\":\"jnl\"'", 0, "5\n", ""},
    {"looks for the LUN list below root only", "mkdir -p r/var/db/iscsi; ln -s ../../../../luns.json r/var/db/iscsi; "
     "epinspect --root r/ lun 7 8", 1, "",
     says({"/var/db/iscsi/luns.json" + leadsOut,
           "LUN 7" + noLun + "The LUN list /dev/null is missing or cannot be read: Invalid argument (code 9002)",
           "LUN 8…"})},
    {"refuses links out of root", "mkdir r; cp data r/EP_DAT_1; ln -s EP_DAT_1 r/EP_DAT_2; ln -s ../data r/out; "
     "ln -s out r/in; cp data r2; ln -s ../r2 r/beside; epinspect --root r dump --json EP_DAT_1 EP_DAT_2 out in beside",
     1, "{\"kind\":\"dat\",…\n{\"kind\":\"dat\",…\n{\"kind\":\"error\",…{\"kind\":\"error\",…{\"kind\":\"error\",…\n",
     says({"out" + leadsOut, "in" + leadsOut, "beside" + leadsOut})},

    usage("", "a subcommand is missing, one of list, …", ""),
    usage("mapp x", "unknown subcommand 'mapp', not one of list, …", ""),
    usage("map x --fisrt 3", "unknown option '--fisrt'", " map"),
    usage("entry x", "INDEX is missing", " entry"),
    usage("extent data 0", "--extent-size is missing", " extent"),
    usage("map x --first", "--first needs a value: N", " map"),
    usage("map x --json=false", "--json takes no value: '--json=false'", " map"),
    usage("map x --count 1 --count 1", "--count: given twice", " map"),
    usage("map -- x --y", "unexpected argument: '--y'", " map"),
    usage("map x --chart --json", "--chart excludes --json", " map"),
    usage("dump --as foo x", "--as: 'foo': not one of tbl, dat, fri, jnl, map, head", " dump"),
    usage("dump x ''", "FILE: '': must not be empty", " dump"), usage("map ''", "MAP: '': must not be empty", " map"),
    usage("entry x -1", "INDEX: '-1': not a number, nor FIRST-LAST", " entry"),
    usage("lun 9-8", "LID: '9-8': range runs backwards", " lun"),
    usage("locate 1 5X", "OFFSET: '5X': not a size; K, M, G, T, KiB, MiB, GiB or TiB may follow a number", " locate"),
    usage("path dat /volume1/x --extent-address 9 --extent-size 0", "--extent-size: '0': must not be 0", " path dat"),
    usage("extent data 0 --extent-size 0", "--extent-size: '0': must not be 0", " extent"),
    usage("read 1 --extent-size 0", "--extent-size: '0': must not be 0", " read"),
    usage("--root EP_TBL dump x", "--root: 'EP_TBL': not a folder", ""),
    {"takes options anywhere and repeatedly", "epinspect -vv entry --json --json -- gone 0", 1, "{\"kind\":\"error\",…",
     says({"iSCSI:ISCSIEPFile.cpp:37:readHeader Failed to open file. path: gone",
           "iSCSI:ISCSIEPFile.cpp:59:parseHead0 Failed to read header. path: gone", "gone" + missing})},
    {"helps", "for c in '' map path 'path jnl' 'path dat'; do epinspect $c --help --nonsense; done | grep -A5 Usage; "
     "epinspect read -h | grep -A1 -e '--[ac]'; epinspect help path | sed -n 6p; epinspect help path jnl; "
     "epinspect -V --nonsense", 0, "Usage: epinspect SUBCOMMAND ... [-V, --version]\n…"
     "Usage: epinspect map MAP [--first N] [--count N] [--chart] [--json]\n…"
     "Usage: epinspect path SUBCOMMAND ...\n…Usage: epinspect path dat EPFILE --extent-size SIZE --extent-address N\n"
     "…       [--json] [--extent-size SIZE] [--address-bits 48|52]\n       [--count-from file|volume]\n\n--\n"
     "  --address-bits 48|52  How many bits of an entry are its extent address;\n"
     "                        matters where bits 48 to 51 are set\n  --count-from file|volume\n"
     "                        From where extents are counted: within the data file, or\n"
     "  tbl                   The table file of a volume\nThe journal of the machine.\n\n"
     "Usage: epinspect path jnl [EPFILE]\n\n"
     "Arguments:\n  EPFILE                An EP file of the volume; it is not opened\n\nOptions everywhere:\n"
     "  --root DIR            Folder that stands for / of the target\n"
     "  -v, --verbose         Show the library's log lines on standard error\n"
     "  -h, --help            Show this help and exit\nepinspect 1.0.0\n", ""},
    {"shows arguments and options", "epinspect help lun | head -n 10", 0,
     "Show the configuration of LUNs and the paths of their map files.\n\nUsage: epinspect lun LID... [--json]\n\n"
     "Arguments:\n  LID                   LUN id; FIRST-LAST for those that exist from FIRST to\n"
     "                        LAST\n\nOptions:\n  --json                One JSON object per LUN\n", ""},
    {"fails when output cannot be written", "(ulimit -f 1; epinspect help >limited; echo $?; "
     "epinspect help map >/dev/full; echo $?; epinspect -V >&-; echo $?)", 0, "1\n1\n1\n",
     says({"standard output: File too large", "standard output: No space left on device",
           "standard output: Bad file descriptor"})},
    {"says nothing when the reader goes", "{ epinspect extent " + data0 + " 0 --extent-size 1M; echo $? >status; } | "
     "true; cat status", 0, "1\n", ""},
    {"does without streams that are missing", "epinspect -V <&- 2>&-; epinspect dump EP_TBL gone data 2>&- >out; "
     "echo $?; wc -l <out", 0, "epinspect 1.0.0\n1\n26\n", ""},
};
// clang-format on

}  // namespace

TEST_P(Frame, Promises) { expect(GetParam()); }
INSTANTIATE_TEST_SUITE_P(, Frame, testing::ValuesIn(cases), nameOf);
