// epinspect on stores with links, closed folders and odd names: what lies where, as on the target.
#include "ProgramTest.h"

namespace {

/// Below `r`, which stands for / of the target, lies a table whose extent size is 4369; beside `r` one of 8738.
class Root : public ProgramTest {
protected:
    Root() {
        write("r/volume1/@iSCSI/EP/EP_TBL", EPFileBuilder::table().set(epbuilder::tbl::extentSize, 0x1111));
        write("out/volume1/@iSCSI/EP/EP_TBL", EPFileBuilder::table().set(epbuilder::tbl::extentSize, 0x2222));
        write("map", EPFileBuilder::map().entry(0, 0x8000000000000003));
    }
};

/// Shell functions: the extent sizes that dump shows of tables below r; then a LUN list below r, of LUN 3 with its map
/// below a folder; and below r a link `b/b` that leads deeper than a path may be long, with a link there that leads out
/// of r and one that does not.
const std::string tables =
                      "t() { epinspect --root r dump --json \"$@\" | grep -oE 'tSize.:[0-9]*|\"error.:.[A-Z_]*'; };",
                  lun =
                      "lun() { mkdir -p r/var/db/iscsi; printf '[{\"lid\":3,\"extentSize\":4096,\"size\":4096,"
                      "\"restoreTime\":0,\"type\":7,\"uuid\":\"u\",\"rootPath\":\"%s\",\"name\":\"n\"}]' \"$1\" "
                      ">r/var/db/iscsi/luns.json; };",
                  deep =
                      "perl -e 'chdir \"r\"; $n = 1 x 200; $p = \"$n/\" x 12; symlink $p, \"b\"; for (1..24) { "
                      "symlink $p, \"b\" if $_ == 13; mkdir $n; chdir $n; $up .= \"../\" } "
                      "symlink \"${up}../out\", \"out\"; symlink \"${up}volume1\", \"in\"';";
const std::string openFailed = " (EP_ERR_OPEN_FAILED, 18990038)";
const std::string denied = ": cannot be opened: Permission denied" + openFailed;
const std::string leadsOut = ": cannot be opened: a link leads out of the folder of --root" + openFailed;
const std::string tooMany = ": cannot be opened: Too many levels of symbolic links" + openFailed;
const std::string noList =
    "LUN 3: configuration cannot be loaded: The LUN list /dev/null is missing or cannot be read: Invalid argument "
    "(code 9002)";
const std::string ep = "/volume1/@iSCSI/EP/", table = ep + "EP_TBL", map = "/volume1/@iSCSI/LUN/THINun_00000";
const std::string in = "tSize\":4369\n", refused = "\"error\":\"EP_ERR_OPEN_FAILED\n";
const std::string abc = "map         24584  1 entry  /volume1/@iSCSI/LUN/a  b  c\n";
const std::string listed = "tbl         24576  " + table + "\n";

/// The object of a file, with its size and with what comes after that.
std::string json(const std::string& path, const std::string& kind, const std::string& more,
                 const std::string& size = "24576") {
    return R"({"kind":"file","file":")" + path + R"(","fileKind":")" + kind + R"(","size":)" + size + R"(,"missing":)" +
           (size == "null" ? "true" : "false") + more + "}\n";
}

// clang-format off
const Case cases[] = {
    {"links lead where they lead on the target", tables + "cd r; ln -s /volume1 abs; ln -s volume1/@iSCSI rel; "
     "ln -s /abs/@iSCSI/EP/EP_TBL file; ln -s ../../../file volume1/@iSCSI/EP/twice; ln -s /../../volume1 above; "
     "ln -s . self; cd ..; t --as tbl abs/@iSCSI/EP/EP_TBL rel/EP/EP_TBL file volume1/@iSCSI/EP/twice "
     "/above/@iSCSI/EP/EP_TBL rel/../@iSCSI/EP/EP_TBL abs/../self/../volume1/@iSCSI/EP/EP_TBL /../.." + table +
     " r/rel/../.." + table + " r/../r" + table + " \"$PWD/r/file\"; cd r/volume1; "
     "epinspect --root .. path tbl @iSCSI", 0,
     in + in + in + in + in + in + in + in + in + in + in + table + "\n", ""},
    {"links that lead out are refused in every component", tables + "ln -s ../out r/folder; ln -s ../out" + table +
     " r/file; ln -s file r/chain; ln -s ../../out r/volume1/up; mkdir -p r/volume2 r/var; "
     "ln -s ../../out/volume1/@iSCSI r/volume2/@iSCSI; ln -s ../../out/volume1 r/var/db; ln -s gone r/volume3; "
     "t folder" + table + " file chain volume1/up" + table + " r/folder/../r" + table + "; "
     "T='epinspect --root r'; $T extent --raw file 0 --extent-size 1; $T list --luns 3; "
     "ln -s ../map r/collection.json; "
     "$T lun 3; epinspect diff r r >r/none", 1,
     refused + refused + refused + refused + refused + listed,
     says({"folder" + table + leadsOut, "file" + leadsOut, "chain" + leadsOut, "volume1/up" + table + leadsOut,
           "r/folder/../r" + table + leadsOut, "file" + leadsOut, "/var/db/iscsi/luns.json" + leadsOut, noList,
           "/var/db/iscsi" + leadsOut, "/volume2/@iSCSI/EP" + leadsOut, "/volume2/@iSCSI/LUN" + leadsOut,
           "/volume3/@iSCSI/EP" + missing, "/volume3/@iSCSI/LUN" + missing, "r/collection.json" + leadsOut,
           "r/collection.json" + leadsOut}) + "…"},
    {"links are followed however long the way is", tables + deep + "mkdir -p r/var/db; "
     "ln -s b/b/out/volume1 r/volume2; ln -s /b/b/out/volume1/@iSCSI r/var/db/iscsi; t b/b/in/@iSCSI/EP/EP_TBL "
     "b/b/out" + table + "; epinspect --root r list --luns 3; s=$?; rm -r r; exit $s", 1, in + refused + listed,
     says({"b/b/out" + table + leadsOut, "/var/db/iscsi/luns.json" + leadsOut, noList, "/var/db/iscsi" + leadsOut,
           "/volume2/@iSCSI/EP" + leadsOut, "/volume2/@iSCSI/LUN" + leadsOut})},
    {"no more links are followed than by the system", tables + lun + "ln -s ." + table + " r/1; for i in $(seq 40); do "
     "ln -s $i r/$((i + 1)); done; t --as tbl ./40 ./41; lun /volume1; mv r/var/db/iscsi/luns.json .; "
     "ln -sf ../luns.json r/1; ln -s /41 r/var/db/iscsi/luns.json; epinspect --root r lun 3", 1, in + refused,
     says({"./41" + tooMany, "/var/db/iscsi/luns.json" + tooMany, noList})},
    {"a path of the target is none that the user typed", lun + "lun \"$PWD/r\"; m=$PWD/r/@iSCSI/LUN; "
     "mkdir -p r/@iSCSI \"r$m\"; cp map \"r$m/THINun_00000\"; for c in list 'find --pool 0' 'read 3'; do "
     "epinspect --root r $c; done | grep -ac 'LUN 3'", 0, "2\n",
     "…LUN 3 bytes 0-4095: path names no volume (EP_ERR_NO_PATH, 18990401)\n…"},
    {"a map is missing only where nothing is", lun + "mkdir -p r/volume1/@iSCSI/LUN; cp map r" + map +
     "; for p in /../../volume1 volume1 /volume1/@iSCSI/.. /volume3 $(printf %0256d 0); do lun $p;"
     " epinspect --root r lun 3 --json; "
     "done | grep -o 'missing.*'; lun /volume1; chmod 644 r/volume1/@iSCSI; "
     "(closed epinspect --root r lun 3 --json); s=$?; chmod 755 r/volume1/@iSCSI; exit $s", 1,
     "missing\":false}\nmissing\":false}\nmissing\":false}\nmissing\":true}\nmissing\":null}\n"
     "{\"kind\":\"error\",\"file\":\"" + map + "\",…{\"kind\":\"lun\",…\"missing\":null}\n",
     "…0/@iSCSI/LUN/THINun_00000: cannot be opened: File name too long" + openFailed + "\n" + says({map + denied})},
    {"list shows links and files of several names", "cd r" + ep + "; large truncate -s 4294967299 EP_DAT_00000; "
     "ln -s /volume1/x EP_DAT_00001; ln -s EP_DAT_00000 EP_DAT_00002; ln EP_TBL EP_FRI; "
     "ln -s volume1 ../../../volume2; "
     "T='epinspect --root ../../.. list'; $T --json | head -n 5; $T | tail -n +3 | head -n 6", 0,
     json(table, "tbl", "") + json(ep + "EP_FRI", "fri", ",\"sameAs\":\"" + table + "\"") +
     json(ep + "EP_DAT_00000", "dat", "", "4294967299") +
     json(ep + "EP_DAT_00001", "dat", R"(,"link":"/volume1/x")", "null") +
     json(ep + "EP_DAT_00002", "dat", R"(,"link":"EP_DAT_00000","sameAs":")" + ep + "EP_DAT_00000\"", "4294967299") +
     "      same file as " + table + "\ndat    4294967299  " + ep + "EP_DAT_00000\n"
     "dat       missing  " + ep + "EP_DAT_00001  link to /volume1/x\n"
     "dat    4294967299  " + ep + "EP_DAT_00002  link to EP_DAT_00000\n      same file as " + ep + "EP_DAT_00000\n"
     "tbl         24576  /volume2/@iSCSI/EP/EP_TBL\n", "…"},
    {"one file under two names is one owner of its extents", "epsample s; l=s/volume2/@iSCSI/LUN; ln $l/THIN* $l/a; "
     "ln -s a $l/b; for f in '' $l/*; do epinspect check --root s $f | grep -c shared-extents; done; "
     "epinspect check --root s $l/* | grep findings", 0, "0\n0\n0\n0\n1 file, 256 entries, 0 findings\n", ""},
    {"names that the target gives to no file are told apart", "epsample s; cd s" + ep + "; mv EP_DAT_00001 EP_DAT_1; "
     ">EP_DAT_0000; T='epinspect --root ../../..'; $T list | grep EP_DAT; $T list --json | grep -c 'misnamed\":true'; "
     "$T check 2>&1 | grep -m 1 -o missing-data-file", 0, "dat    6442475520  " + ep + "EP_DAT_00000\n"
     "dat             0  no data file of the target  " + ep + "EP_DAT_0000\n"
     "dat    6442475520  no data file of the target  " + ep + "EP_DAT_1\n"
     "dat      16801792  /volume2/@iSCSI/EP/EP_DAT_00000\n2\nmissing-data-file\n", ""},
    {"list breaks no line inside a name", "rm r/volume1/*/*/*; mkdir r/volume1/@iSCSI/LUN; "
     "cp map 'r/volume1/@iSCSI/LUN/a  b  c'; for c in 20 49 70 '' x 0; do COLUMNS=$c epinspect --root r list; done", 0,
     "map         24584\n      1 entry\n      /volume1/@iSCSI/LUN/a  b  c\n"
     "map         24584  1 entry\n      /volume1/@iSCSI/LUN/a  b  c\n" + abc + abc + abc + abc, "…"},
    {"a closed folder is one message that names it", lun + "lun /volume1; mkdir r/volume1/@iSCSI/LUN; "
     "cp map r" + map + "; cd r/volume1; >@iSCSI/EP/EP_FRI; for f in '000 @iSCSI/EP' '444 @iSCSI/EP' "
     "'311 @iSCSI/EP' '600 @iSCSI' '600 .'; do chmod $f; (cd ..; closed epinspect --root . list --luns 3; echo $?); "
     "chmod 755 \"$PWD\"; chmod -R u=rwX .; done 2>../../err | grep -v jnl; cat ../../err >&2", 0,
     "map…THINun_00000\n1\nmap…THINun_00000\n1\ntbl…\nfri…\nmap…THINun_00000\n1\n1\n1\n",
     says({"/volume1/@iSCSI/EP" + denied, "/volume1/@iSCSI/EP" + denied, "/volume1/@iSCSI/EP" + denied,
           "/volume1/@iSCSI" + denied, "/volume1" + denied})},
};
// clang-format on

}  // namespace

TEST_P(Root, Promises) { expect(GetParam()); }
INSTANTIATE_TEST_SUITE_P(, Root, testing::ValuesIn(cases), nameOf);
