// How LUNs are found and named: ids that are tried, on a platform of the tests' own too, and maps named by LUN id.
#include <cerrno>
#include <cstring>

#include "InProcess.h"
#include "ProgramTest.h"

// The platform's library, for the program as a function of the test: LUN 1 is fine, LUN 2 is damaged. Ids without a LUN
// get -5, those above 65535 -6; with `down` every id gets -8, with `comesAndGoes` -9 but for
// LUN 1 and large ids right after it.
static bool down = false, rewritten = false, comesAndGoes = false, isThere = false;
static int reason = 0;  ///< errno for ids without a LUN
static unsigned int loadsOfLun2 = 0, unused = 0;

extern "C" __attribute__((visibility("default"))) int KELPiSCSILunGetByLid(unsigned int lid, int, void* record) {
    errno = lid == 2 ? EIO : reason;
    if (down) return -8;
    isThere = lid == 1 || (isThere && lid > 65535);
    if (comesAndGoes && !isThere) return -9;
    if (lid == 2) return ++loadsOfLun2 == 1 ? -7 : 0;
    if (lid == 1) std::memcpy(static_cast<char*>(record) + 118, "/volume1", 8);
    if (lid > 65535 && rewritten) return ++unused > 20 ? -9 : -6;
    return lid == 1 ? 0 : lid > 65535 ? -6 : -5;
}

extern "C" __attribute__((visibility("default"))) const char* KELPiSCSIStrError(int code) {
    return code == -5 ? "no such" : code == -7 ? "damaged" : code == -8 ? "out of service" : nullptr;
}

namespace {

class Luns : public ProgramTest {
protected:
    Luns() { std::filesystem::create_directories(path("empty")); }

    /// The program in this process, on that platform.
    void expectHere(const std::vector<const char*>& words, int status, const std::string& err) const {
        EXPECT_EQ(status, run([&] { _exit(chdir(path("empty").c_str()) == 0 ? runHere(words) : 99); }));
        EXPECT_TRUE(fits(content(".err"), err));
    }
};

const std::string map1 = "/volume1/@iSCSI/LUN/BLUN6f1c1d0a-58d3-4e0f-9b51-2f7a9c5e0d11lun1_00000";
const std::string list = "store/var/db/iscsi/luns.json",
                  twoLuns =
                      "epsample s; sed 's/^\\[/[{\"lid\":9,\"name\":1},/; "
                      "s/\"lid\": 2/\"lid\": 300/; s/lun2/lun1/; s/0b9d.*522/6f1c1d0a-58d3-4e0f-9b51-2f7a9c5e0d11/; "
                      "s/volume2/volume1/; s/: 7/: 263/' " +
                      list + " >s/var/db/iscsi/luns.json; ";
const std::string lun9 =
    "LUN 9: configuration cannot be loaded: The LUN list s/var/db/iscsi/luns.json holds a value of the wrong type, or "
    "one that does not fit its field: Bad message (code 9004)";
const std::string none9003 =
    " is known: The LUN list s/var/db/iscsi/luns.json is not a JSON array: Bad message (code 9003)\n";
const std::string noList = "The LUN list s/var/db/iscsi/luns.json is missing or cannot be read: ",
                  notKnown = "LUN 0-255: none is known: ";

// clang-format off
const Case cases[] = {
    {"takes an id wherever it takes a map", "for c in 'map M --json' 'map M --chart' 'entry M 0-9 --json' "
     "'find M --pool 0' 'find M --extent 4 --json' 'locate M 5M' 'locate M 5M --json' 'diff 2 M --json' "
     "'read M --length 99K' 'check M --json' 'dump M'; do for m in 1 " + map1 + "; do "
     "epinspect --root store $(echo \"$c\" | sed s,M,$m,) >$(basename $m) || echo \"$c: $?\"; done; "
     "cmp 1 $(basename " + map1 + ") && test -s 1 || echo \"$c differs\"; done; "
     "epinspect --root store map 1 | tail -n 1; epinspect --root store entry 2 1 --json; "
     "epinspect --root store dump 2 gone --json", 1,
     "diff 2 M --json: 3\ndiff 2 M --json: 3\n"
     "LUN 1: 4096 entries in …\n{\"kind\":\"entry\",\"file\":\"/volume2/@iSCSI/LUN/THIN…_00000\",\"lid\":2,\"index\":1,"
     "…\n{\"kind\":\"map\",\"file\":\"/volume2/@iSCSI/LUN/THIN…_00000\",\"lid\":2,\"head0Checksum\":…\n"
     "{\"kind\":\"error\",\"file\":\"gone\",\"error\":…\n", "epinspect: gone: cannot be opened: …\n"},
    {"takes a file of digits after a dot", "cp store" + map1 + " 7; epinspect map ./7 | tail -n 1; epinspect map 7", 1,
     "4096 entries in …\n",
     says({"LUN 7: configuration cannot be loaded: The LUN list /var/db/iscsi/luns.json is missing or cannot be read: "
     "No such file or directory (code 9002)"})},
    {"keeps all LUNs that have a map", twoLuns + "epinspect --root s find --extent 0 --luns 1-300 --json | head -n 2;"
     " epinspect --root s find --extent 0 --luns 1-300 | head -n 1;"
     "epinspect --root s list --luns 300 | grep LUN; epinspect --root s locate " + map1 +
     " 0 | head -n 1; epinspect --root s diff 300 1 --json | tail -n 1; "
     "epinspect --root s check --luns 10-300 | grep -o 'LUN [0-9]*: [a-z]*-[a-z]*';"
     " epinspect --root s check --luns 1-300 2>out | grep -o 'LUN 300: [a-z]*-[a-z]*'", 0,
     "{\"kind\":\"error\",\"file\":null,\"lid\":9,\"error\":null,\"code\":9004,…\n{\"kind\":\"match\",\"file\":\"" +
     map1 + "\",\"lid\":1,\"lids\":[1,300],\"first\":0,…\n" +
     map1 + ": LUNs 1, 300: 0: mapped…\nmap         57344  LUN 300 …\nLUN 1 byte 0: …\n"
     "{\"kind\":\"summary\",\"file\":\"" + map1 + "\",\"lid\":300,\"otherFile\":\"" + map1 +
     "\",\"otherLid\":1,…\nLUN 300: lun-size\nLUN 300: beyond-data\nLUN 300: extent-size\nLUN 300: lun-size\n"
     "LUN 300: extent-size\nLUN 300: same-map\n", says({lun9, lun9})},
    {"reports a damaged LUN", twoLuns + "for c in 'lun 8-10' list check 'find --extent 7' 'check 1';"
     " do epinspect -v --root s $c | tail -n 1; done", 0, "…1 match of 1 entry\n…",
     "epinspect: iSCSI:ISCSILUNConfInfo.cpp:43:loadFromConfig …lid: 9 ,…\nepinspect: " + lun9 + "\nepinspect: iSCSI:…" +
     lun9 + "\n…" + lun9 + "\n…" + lun9 + "\n…" + lun9 + "\n"},
    {"shows log lines after LUN ids were tried", "epsample s; truncate -s 9 s/volume2/@iSCSI/LUN/*; "
     "epinspect -v --root s find --pool 1", 1, "5120 entries …\n",
     "epinspect: iSCSI:ISCSIEPFile.cpp:42:readHeader …\nepinspect: iSCSI:ISCSIEPFile.cpp:59:parseHead0 …\n…"
     "…ends too early (EP_ERR_READ_FAILED, 18990039)\n"},
    {"names what may be the LUN of a map", twoLuns + "cp s" + map1 + " s/volume1/@iSCSI/LUN/copy; "
     "cp s" + map1 + " s/x; for m in volume1/@iSCSI/LUN/copy 'x --extent-size 1M'; do "
     "epinspect --root s locate /$m 0; done", 1,
     "/x byte 0: entry 0, byte 0 of its extent\n0: mapped synced, pool 0, extent 0\nassumed: …\n",
     says({lun9, "/volume1/@iSCSI/LUN/copy: extent size not known, give --extent-size: no LUN with an id from 0 to 255 "
     "has this map file (EP_ERR_BAD_EXTENT_SIZE, 18990507)", "/x: byte 0: path names no volume (EP_ERR_NO_PATH, "
     "18990401)"})},
    {"takes the first of two LUNs with one map", twoLuns + "sed -i 's/300/200/' s/var/db/iscsi/luns.json; "
     "epinspect --root s locate " + map1 + " 70000 2>err | head -n 1; cat err >&2", 0,
     "LUN 1 byte 70000: entry 0, byte 70000 of its extent\n",
     says({map1 + ": LUN 200 has this map file too, with another extent size"})},
    {"reports a damaged LUN once", twoLuns + "epinspect --root s find 9 --extent 7", 1,
     "0 entries in 0 maps: 0 matches of 0 entries\n", says({lun9})},
    {"names the map in errors about a LUN", "epinspect --root store locate 1 4G --json; epsample s;"
     " rm s" + map1 + "; epinspect --root s locate 1 0 --json", 1,
     "{\"kind\":\"error\",\"file\":\"" + map1 + "\",\"lid\":1,\"error\":\"EP_ERR_READ_FAILED\",…\n"
     "{\"kind\":\"error\",\"file\":\"" + map1 + "\",\"error\":\"EP_ERR_OPEN_FAILED\",…\n",
     "…past the end…\n…cannot be opened…\n"},
    {"needs no LUN list", "epsample s; rm s/var/db/iscsi/luns.json; for c in list check 'find --extent 0';"
     " do epinspect --root s $c >out || echo $?; done; epinspect --root s find " + map1 + " --extent 0; "
     "epinspect --root s locate " + map1 + " 0", 1, map1 + ": 0: mapped …\n4096 entries in 1 map: 1 match of 1 entry\n",
     says({notKnown + noList + "No such file or directory (code 9002)", notKnown + noList +
     "No such file or directory (code 9002)", notKnown + noList + "No such file or directory (code 9002)",
     map1 + ": extent size not known, give --extent-size: no LUN with an id from 0 to 255 has this map file "
     "(EP_ERR_BAD_EXTENT_SIZE, 18990507)"})},
    {"fails on a LUN list of no use", "epsample s; L=s/var/db/iscsi/luns.json; echo [ >$L;"
     " for c in list check 'find --extent 0' 'find " + map1 + " --extent 0' 'locate " + map1 + " 0' 'map " + map1 +
     "'; do "
     "epinspect --root s $c 2>err >out; echo $? $(sed 's/.*: none//' err); done; rm $L; mkdir $L;"
     " epinspect --root s check >out; echo $?; rmdir $L; echo '[]' >$L; epinspect --root s list >out; echo $?; "
     "epinspect --root s list --luns 3-4 >out", 1, "1" + none9003 + "1" + none9003 + "1" + none9003 + "1" + none9003 +
     "1 is known:…not known, give --extent-size…\n0\n1\n0\n",
     says({notKnown + noList + "Invalid argument (code 9002)", notKnown + "No such LUN (code 9001)",
     "LUN 3-4: none is known: No such LUN (code 9001)"})},
    {"loses no LUN of a damaged LUN list without a word", "epsample s; cd s/var/db/iscsi; L=luns.json; cp $L good;"
     " T='epinspect --root ../../..'; "
     "t() { for c in check 'check " + map1 + "' 'lun 1-2'; do $T $c >out; echo -n $?; done; };"
     " sed 's/^\\]/, {}]/' good >$L; t; echo '[{}]' >$L; t; "
     "sed 's/name\": /&5, \"x\": /' good >$L; t; rm $L; ln -s none $L; t; "
     "export KELPISCSIEP_LUNS=none; t", 0, "110111111111111", "…"},
    {"looks for every map of a LUN", "epsample s; rm s/volume2/@iSCSI/LUN/*; epinspect --root s find --pool 16 |"
     " tail -n 1; epinspect --root s find --pool 16 >out", 1,
     "5120 entries in 2 maps: 4 matches of 896 entries\n", says({
     "/volume2/@iSCSI/LUN/THIN0b9d2f64-7c1e-4a55-8a3b-90c4d7e6f522lun2_00000" + missing,
     "/volume2/@iSCSI/LUN/THIN0b9d2f64-7c1e-4a55-8a3b-90c4d7e6f522lun2_00000" + missing})},
};
// clang-format on

}  // namespace

TEST_F(Luns, AreToldFromIdsWithoutOne) {
    const std::string log =
        "iSCSI:ISCSILUNConfInfo.cpp:43:loadFromConfig Failed to get LUN config by LUN ID. info: lid: 2 ,…";
    const std::string damaged = "LUN 2: configuration cannot be loaded: damaged: Input/output error (code -7)";
    // Each id is loaded once: that LUN 2 could be loaded the next time does not matter.
    expectHere({"", "-v", "lun", "0-255"}, 1, says({log, damaged}));
    expectHere({"", "lun", "0-1"}, 1, says({"LUN 0: configuration cannot be loaded: no such (code -5)"}));
    expectHere({"", "lun", "4294967000-4294967200"}, 1, says({"LUN 4294967000-4294967200: none is known (code -6)"}));
    expectHere({"", "lun", "1-2"}, 1, says({damaged}));
    rewritten = true;
    expectHere(
        {"", "lun", "0-255"}, 1,
        says({damaged,
              "LUN 0-255: some may be missing, the answer for ids without a LUN has changed meanwhile (code -9)"}));
    rewritten = false;
    comesAndGoes = true;
    expectHere(
        {"", "lun", "0-2"}, 1,
        says({"LUN 0-2: some may be missing, the answer for ids without a LUN has changed meanwhile (code -6)"}));
    comesAndGoes = false;
    down = true;
    const std::string noFiles = "…no EP files there…", none = "LUN 0-255: none is known: out of service";
    for (const int system : {0, ENOENT, EACCES}) {
        reason = system;
        const std::string why = system == 0        ? ""
                                : system == ENOENT ? ": No such file or directory"
                                                   : ": Permission denied";
        expectHere({"", "--root", ".", "find", "--pool", "1"}, system == EACCES ? 1 : 0,
                   says({none + why + " (code -8)"}));
    }
}

TEST_P(Luns, Promises) { expect(GetParam()); }
INSTANTIATE_TEST_SUITE_P(, Luns, testing::ValuesIn(cases), nameOf);
