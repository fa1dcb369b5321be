// epinspect collect and diff: a store to take along, and what has changed since.
#include <sys/uio.h>

#include <csignal>

#include "InProcess.h"
#include "ProgramTest.h"

static std::function<void()> beforeRead = [] {};  ///< of each piece that is copied

// pread() itself, whatever a hardened build makes of that name.
ssize_t preadAfterChange(int descriptor, void* bytes, std::size_t size, off_t position) __asm__("pread64");
[[gnu::visibility("default")]] ssize_t preadAfterChange(int descriptor, void* bytes, std::size_t size, off_t position) {
    beforeRead();
    const iovec piece = {bytes, size};
    return preadv(descriptor, &piece, 1, position);
}

namespace {

const std::string map2 = "/volume2/@iSCSI/LUN/THIN0b9d2f64-7c1e-4a55-8a3b-90c4d7e6f522lun2_00000";
const std::string table2 = "/volume2/@iSCSI/EP/EP_TBL", data2 = "/volume2/@iSCSI/EP/EP_DAT_00000";
const std::string incomplete = "epinspect: c: the collection is incomplete\n",
                  mayMiss = "epinspect: c: files may be missing, the collection is incomplete\n";
const std::string notTaken = "not in the collection, which holds no data (EP_ERR_READ_FAILED, 18990039)\n";

class Collect : public ProgramTest {
protected:
    Collect() { expect({"", "epsample own", 0, "", ""}); }

    /// epinspect collect in this process, while beforeRead() does as the test wants. Returns its exit status.
    int collectHere() const {
        return run([root = path("own"), folder = path("c")] {
            _exit(runHere({"", "--root", root.c_str(), "collect", folder.c_str()}));
        });
    }
};

/// A damage to collection.json, and the message about it.
Case damaged(const std::string& how, const std::string& edit, const std::string& said) {
    return {"refuses a collection " + how,
            "epinspect --root own collect c >/dev/null; cd c; " + edit + "; epinspect --root . list --json", 1,
            R"({"kind":"error","file":"./collection.json",…"EP_ERR_READ_FAILED","code":18990039,…)",
            "epinspect: ./collection.json: is damaged: " + said + " (EP_ERR_READ_FAILED, 18990039)\n"};
}

// clang-format off
const Case cases[] = {
    {"collects all but the data", "epinspect --root own collect c; find c -type f -size +60k; diff -r own c", 1,
     "11 files and 3 LUNs collected, 313344 bytes: c\nOnly in c: collection.json\n"
     "diff -r own/var/db/iscsi/luns.json c/var/db/iscsi/luns.json\n…Binary files…EP_DAT_00000 differ\n"
     "Binary files…EP_DAT_00001 differ\nBinary files own" + data2 + " and c" + data2 + " differ\n", ""},
    {"answers on a collection as on the store", "printf x >>own" + map2 + "; rm own" + table2 + "; "
     "ln -s gone own/volume1/@iSCSI/EP/EP_DAT_00002; ln own" + data2 + " own/volume2/@iSCSI/EP/EP_DAT_00001; "
     "mkdir own/spare; mv own/volume2/@iSCSI/EP/EP_FRI own/spare/f; ln -s /spare/f own/volume2/@iSCSI/EP/EP_FRI; "
     "ln -s ../EP/EP_DAT_00000 own/volume2/@iSCSI/EP/EP_DAT_00002; "
     "epinspect --root own collect c; for what in 'list --json' check 'check --json' 'locate 1 540000000' "
     "'map " + map2 + "' 'find --pool 32' 'entry " + map2 + " 0' 'lun 1-2' 'dump /var/db/iscsi/EP_JNL'; do "
     "for root in own c; do epinspect --root $root $what 2>&1 | grep -v 'a collection of' >$root.out; done; "
     "cmp own.out c.out; done; stat -c %h c/volume2/*/EP/EP_DAT_00001", 0,
     "13 files and 3 LUNs collected, …: c\n2\n", ""},
    {"keeps a configuration without LUNs", "echo '[]' >own/var/db/iscsi/luns.json; epinspect --root own collect c; "
     "epinspect --root c check | tail -n 0", 0, "11 files and 0 LUNs …",
     "epinspect: LUN 0-255: none is known: No such LUN (code 9001)\nepinspect: c: a collection of …\n"
     "epinspect: LUN 0-255: none is known: No such LUN (code 9001)\n"},
    {"keeps holes and times", "umask 22; large truncate -s 40M own" + map2 + "; "
     "touch -d @1000000000.5 own" + map2 + "; large epinspect --root own collect c >/dev/null; du -k c" + map2 +
     " | cut -f1; stat -c '%.Y %s' c" + map2 + "; stat -c %a c/collection.json c/var/db/iscsi/luns.json", 0,
     "2…\n1000000000.5…41943040\n644\n644\n", ""},
    {"reports what was not collected, never zeros", "epinspect --root own collect c; "
     "epinspect --root c read 2 --offset 1M --length 64K | tr -d '\\0' | wc -c; "
     "epinspect --root c extent " + data2 + " 5 --extent-size 64K --raw; epinspect --root c list | tail -n 0", 0,
     "…c\n0\n", "epinspect: " + data2 + ": LUN 2 bytes 1048576-1114111: " + notTaken +
     "epinspect: LUN 2: 65536 of 65536 bytes could not be read, zeros stand in their place\n"
     "epinspect: " + data2 + ": extent 5: " + notTaken +
     "epinspect: c: a collection of … UTC 20…, without data, made by epinspect 1.0.0\n"},
    {"collects a collection", "epinspect --root own collect c; epinspect --root c collect d; "
     "diff -r c/volume1 d/volume1; epinspect diff own d", 0,
     "…: c\n…: d\n11 files: 0 only in the first, 0 only in the second; no field differs; "
     "5376 entries: no difference\n", ""},
    {"writes into a new or empty folder only", "mkdir full; >full/x; >file; for f in full file own/c own ''; do "
     "epinspect --root own collect \"$f\"; echo $?; done; ls own; mkdir -p s/volume1/@iSCSI/EP; "
     "epinspect collect s/volume1/@iSCSI/EP", 1, "1\n1\n1\n1\n2\nvar\nvolume1\nvolume2\n",
     "epinspect: full: is not empty, and nothing is overwritten; name a new folder or an empty one\n"
     "epinspect: file: is not a folder\nepinspect: own/c: lies inside the store, which is never written\n"
     "epinspect: own: is not empty, …\nepinspect: FOLDER: '': must not be empty. Try 'epinspect collect --help'.\n"
     "epinspect: s/volume1/@iSCSI/EP: lies inside the store, which is never written\n"},
    {"says that a collection is incomplete", "(ulimit -f 20; epinspect --root own collect c); echo $?; "
     "epinspect --root c list | grep -c missing; rm -r c; rm own" + table2 + "; mkdir own" + table2 + "; "
     "epinspect --root own collect c; epinspect --root c list --json | head -n 1; rm c/volume1/@iSCSI/EP/*; "
     "for what in list check; do epinspect --root c $what >/dev/null; echo $?; done; "
     "epinspect diff c c", 1,
     "0 files and 3 LUNs collected, 0 bytes: c\n1\n8\n10 files and 3 LUNs …: c\n"
     R"({"kind":"error","file":"c","error":null,"code":0,"message":"c: files may be missing, the collection is )"
     "incomplete\"}\n1\n1\n…", "epinspect: c/var/db/iscsi/EP_JNL: cannot be written: File too large\n" + incomplete +
     "epinspect: c: a collection of …\n" + mayMiss + "…epinspect: " + table2 + ": cannot be opened: is a folder…)\n" +
     incomplete + "epinspect: c: a collection of …\n" + mayMiss + "…" + mayMiss + mayMiss},
    {"keeps a name that is not UTF-8", "cd own/volume2/@iSCSI/LUN; mv * \"$(printf 'n\\377')\"; cd ../../../..; "
     "epinspect --root own collect c; epinspect --root c list 2>err | tail -n 3 | grep -ac \"$(printf 'n\\377')\"; "
     "grep -ao 'pathHex[^}]*' c/collection.json; for x in x 0 00; do sed \"s/pathHex...../&$x/\" c/collection.json >j; "
     "cp -r c d; cp j d/collection.json; epinspect --root d list 2>&1 | grep -c damaged; done", 0,
     "11 files …\n1\npathHex\":\"2f766f6c756d65322f4069534353492f4c554e2f6eff\"\n1\n1\n1\n", ""},
    {"names what it may not read", "chmod 0 own" + table2 + "; closed epinspect "
     "--root own collect c", 1, "10 files and 3 LUNs …: c\n", "epinspect: " + table2 + ": cannot be opened: Permission "
     "denied (EP_ERR_OPEN_FAILED, 18990038)\n" + incomplete},
    {"is damaged where its list may not be read", "epinspect --root own collect c >/dev/null; "
     "chmod 0 c/collection.json; closed epinspect --root c list", 1, "",
     "epinspect: c/collection.json: …Permission denied…\n"},
    damaged("whose list is not JSON", "echo '{' >collection.json", "not JSON"),
    damaged("whose list lacks something", "sed -i s/complete/x/ collection.json", "not a collection's list"),
    damaged("with a size that is none", "sed -i 's/\"size\":24576,/\"size\":24576.5,/' collection.json",
            "not a collection's list"),
    damaged("that took more than there was", "sed -i s/6442475520/24575/ collection.json", "not a collection's list"),
    damaged("with a path from nowhere", "sed -i 's,\"/var,\"var,' collection.json", "not a collection's list"),
    damaged("whose list does not fit a file", "truncate -s 9 var/db/iscsi/EP_JNL",
            "24576 bytes of /var/db/iscsi/EP_JNL were taken, but the file has 9"),

    {"diff compares headers, entries, or both", "cp own" + map2 + " m; "
     "printf '\\377' | dd of=m bs=1 seek=4100 conv=notrunc status=none; "
     "printf '\\020' | dd of=m bs=1 seek=24583 conv=notrunc status=none; "
     "for o in '' --headers --entries; do epinspect diff own" + map2 + " m $o; done", 3,
     "mappedCount: 128 -> 255\n0: flags changed: mapped synced, …\n1 field differs; 256 entries: 255 same, …, 1 with "
     "other flags\nmappedCount: 128 -> 255\n1 field differs\n0: flags changed: …\n256 entries: 255 same, …\n", ""},
    {"diff shows fields of every form", "cp own" + map2 + " m; for p in 8 24 44; do "
     "printf '\\377' | dd of=m bs=1 seek=$p conv=notrunc status=none; done; "
     "printf '\\001' | dd of=m bs=1 seek=4168 conv=notrunc status=none; epinspect diff own" + map2 + " m", 3,
     "head0MagicCode: 0x1122334455667788 -> 0x11223344556677ff\n"
     "head0UUID: 41424344-4546-4748-494a-4b4c4d4e4f50 -> 41424344-ff46-4748-494a-4b4c4d4e4f50\n"
     "head0CreateTime: Sun Sep 13 12:26:40 UTC 2020 -> Sun Sep 13 12:30:55 UTC 2020\nseg0PoolCount: 2 -> 1\n"
     "poolUUIDs #2: b0b1b2b3-b4b5-b6b7-b8b9-babbbcbdbebf -> none\n5 fields differ; 256 entries: no difference\n", ""},
    {"diff of an unknown kind", "cp own" + map2 + " x; printf '\\011' | dd of=x bs=1 seek=16 conv=notrunc status=none; "
     "cp x y; epinspect diff x y", 0, "no field differs\n",
     "epinspect: x: kind not known from its name or type, only HEAD[0] is compared\n"
     "epinspect: y: kind not known from its name or type, only HEAD[0] is compared\n"},
    {"diff writes fields as JSON", "cp own" + map2 + " m; "
     "printf '\\001' | dd of=m bs=1 seek=4168 conv=notrunc status=none; "
     "printf '\\377' | dd of=m bs=1 seek=44 conv=notrunc status=none; epinspect diff --json own" + map2 + " m", 3,
     R"({"kind":"field","file":"own/…","otherFile":"m","field":"head0CreateTime","a":1600000000,"b":1600000255}
{"kind":"field",…,"field":"seg0PoolCount","a":2,"b":1}
{"kind":"field",…,"field":"poolUUIDs","a":["a0a1…","b0b1…"],"b":["a0a1…"]}
{"kind":"summary",…,"fields":3,"same":256,"onlyFirst":0,…}
)", ""},
    {"diff compares every kind of file with its own kind alone", "cd own/volume1/@iSCSI/EP; for f in EP_TBL EP_FRI "
     "EP_DAT_00000; do epinspect diff $f $f; done; epinspect diff EP_TBL EP_FRI", 1,
     "no field differs\nno field differs\nno field differs\n",
     "epinspect: EP_TBL: is a table file, but EP_FRI is a free-index file: only files of one kind can be compared "
     "(EP_ERR_WRONG_FILE_TYPE, 18990400)\n"},
    {"diff compares stores", "large cp -a own b; rm b" + table2 + "; >b/volume1/@iSCSI/EP/EP_DAT_00009; "
     "truncate -s 99999 b" + data2 + "; printf '\\377' | dd of=b/var/db/iscsi/EP_JNL bs=1 seek=4 conv=notrunc "
     "status=none; epinspect diff own b/; epinspect diff own b --json | tail -n 3; epinspect diff own b" + map2, 2,
     "/var/db/iscsi/EP_JNL: head0Version: 33752069 -> 33752319\n"
     "/volume1/@iSCSI/EP/EP_DAT_00009: only in the second: data file, 0 bytes\n" + table2 +
     ": only in the first: table file, 24576 bytes\n" + data2 + ": size: 16801792 -> 99999\n"
     "12 files: 1 only in the first, 1 only in the second; 2 fields differ; 5376 entries: no difference\n"
     R"({"kind":"storeDifference","file":")" + table2 +
     R"(","otherFile":null,"difference":"only-first","fileKind":"tbl","size":24576})" "\n"
     R"({"kind":"field","file":")" + data2 + R"(","otherFile":")" + data2 + R"(","field":"size","a":16801792,"b":99999}
{"kind":"summary","file":"own","otherFile":"b","summary":true,"files":12,"fields":2,"same":5376,…})" "\n",
     "epinspect: A and B must both be files, or both be folders. Try 'epinspect diff --help'.\n"},
    {"an empty store is no success", "mkdir e; epinspect --root e collect c; echo $?; epinspect diff own e/ |"
     " tail -n 1; "
     "epinspect diff $PWD/e e", 1, "0 files and 0 LUNs collected, 0 bytes: c\n1\n"
     "11 files: 11 only in the first, …\n0 files: …\n",
     "epinspect: LUN 0-255: …\nepinspect: e: no EP files found (EP_ERR_NO_PATH, 18990401)\n" + incomplete +
     "epinspect: e: LUN 0-255: none is known: …\nepinspect: e: no EP files found …\nepinspect: …/e: LUN 0-255: …\n"
     "epinspect: e: LUN 0-255: …\nepinspect: /…/e: no EP files found …\nepinspect: e: no EP files found …\n"},
    {"diff knows the LUNs of both stores", "large cp -a own b; sed -i 's/\"lid\": 2/\"lid\": 31/' "
     "b/var/db/iscsi/luns.json; printf '\\377' | dd of=b" + map2 + " bs=1 seek=44 conv=notrunc status=none; "
     "epinspect diff own b --json | head -n 1", 0,
     R"({"kind":"field","file":")" + map2 + R"(","lid":2,"otherFile":")" + map2 + R"(","otherLid":31,"field":…)" "\n",
     ""},
};
// clang-format on

}  // namespace

TEST_P(Collect, Promises) { expect(GetParam()); }
INSTANTIATE_TEST_SUITE_P(, Collect, testing::ValuesIn(cases), nameOf);

TEST_F(Collect, NeverWritesIntoAStoreThatHasAnotherNameToo) {
    const std::string mounted = "mkdir m; unshare --map-root-user --mount sh -c 'mount --bind own/volume1 m && ";
    if (run(mounted + "true' 2>/dev/null") != 0) GTEST_SKIP() << "nothing can be mounted here";
    expect({"", "rmdir m; " + mounted + "epinspect --root own collect m/c'; ls own/volume1", 0, "@iSCSI\n",
            "epinspect: m/c: lies inside the store, which is never written\n"});
}

TEST_F(Collect, KeepsWhatItHasWhenInterrupted) {
    int reads = 0;
    beforeRead = [&reads] {
        if (++reads == 2) static_cast<void>(raise(SIGTERM));
    };
    EXPECT_EQ(1, collectHere());
    EXPECT_TRUE(fits(content(".err"), "epinspect: …/c: interrupted: the collection is incomplete\n"));
    expect({"", "epinspect --root c dump --json /var/db/iscsi/EP_JNL; cd c; find * -type f | sort", 0,
            "{\"kind\":\"jnl\"…}\ncollection.json\nvar/db/iscsi/EP_JNL\nvar/db/iscsi/luns.json\n", ""});
}

TEST_F(Collect, NamesACopyThatCannotBeMade) {
    beforeRead = [this] { std::filesystem::create_directories(path("c" + table2)); };
    EXPECT_EQ(1, collectHere());
    EXPECT_TRUE(
        fits(content(".err"), "epinspect: …/c" + table2 + ": cannot be written: Is a directory\n…incomplete\n"));
}

TEST_F(Collect, ReadsAFileThatChangesAgainUpToThreeTimes) {
    int changes = 0;
    beforeRead = [&] {
        if (--changes >= 0) std::ofstream(path("own/var/db/iscsi/EP_JNL"), std::ios::app) << 'x';
    };
    changes = 2;
    EXPECT_EQ(0, collectHere());
    EXPECT_EQ("", content(".err"));
    std::filesystem::remove_all(path("c"));
    changes = 3;
    EXPECT_EQ(0, collectHere());
    EXPECT_TRUE(fits(content(".err"), "epinspect: /var/db/iscsi/EP_JNL: has changed while it was read\n"));
    EXPECT_TRUE(fits(content("c/collection.json"), "…EP_JNL\",…,\"changed\":true}…"));
}
