// epinspect check as a monitoring job runs it: whatever is lost of a store, it is never silent and never 0.
#include "ProgramTest.h"

namespace {

class Losses : public ProgramTest {
protected:
    Losses() {
        expect({"", "chmod 755 .; epsample own", 0, "", ""});
        // Root may read everything.
        if (geteuid() == 0) asUser_ = "setpriv --reuid=65534 --regid=65534 --clear-groups ";
        canBeUser_ = std::system(script(asUser_ + "epinspect --version >.out 2>&1").c_str()) == 0;
    }

    std::string asUser_;
    bool canBeUser_ = false;
};

const std::string volume1 = "/volume1/@iSCSI/", volume2 = "/volume2/@iSCSI/", journal = "/var/db/iscsi/EP_JNL";
const std::string lun1 = volume1 + "LUN/BLUN6f1c1d0a-58d3-4e0f-9b51-2f7a9c5e0d11lun1_00000";
const std::string lun2 = volume2 + "LUN/THIN0b9d2f64-7c1e-4a55-8a3b-90c4d7e6f522lun2_00000";

const std::string gone1 = lun1 + ": LUN 1: missing-data-file: ", no1 = " and others, but there is no EP_DAT_00001\n";
const std::string gone3 = volume1 +
                          "LUN/BLUN91e80b7c-2d46-4f3a-a6c5-18d07f2b6e33lun1-snapshot_00000: LUN 3: "
                          "missing-data-file: ";
const std::string snapshot = "Snapshot: …: LUN 3: shares 160 entries with its parent LUN 1, …\n";
const std::string uncompared = "Not compared: extent-size: no table file that can be compared: ";
const std::string table1 = volume1 + "EP/EP_TBL";

// clang-format off
const Case cases[] = {
    {"a data file is one finding for each map, or all its runs",
     "rm own/volume1/*/EP/*1; epinspect --root own check; epinspect --root own check --each", 3,
     gone1 + "768 entries in 3 runs, first entries 512-767: extent 4194816" + no1 +
     gone3 + "entries 640-767: extent 4194944" + no1 +
     "10 files, 5376 entries, 2 findings: 2 missing-data-file\n" + snapshot +
     gone1 + "entries 512-767: extent 4194816" + no1 + gone1 + "entries 1536-1791: extent 4195840" + no1 +
     gone1 + "entries 3584-3839: extent 4197888" + no1 +
     gone3 + "entries 640-767: extent 4194944" + no1 + "10 files, 5376 entries, 4 findings: 4 missing-data-file\n" +
     snapshot,
     ""},
    {"a data file that a named map needs", "rm own/volume2/@iSCSI/EP/EP_DAT_00000; epinspect --root own check 2", 3,
     "…lun2_00000: LUN 2: missing-data-file: 128 entries in 2 runs, first entries 0-63: extent 16 and others, but "
     "there is no EP_DAT_00000\n1 file, 256 entries, 1 finding: 1 missing-data-file\nNot compared: magic, …\n", ""},
    {"all there is", "epinspect check --root none; mkdir none; epinspect check --root none", 1,
     "0 files, 0 entries, 0 findings\n"
     "Not compared: lun-size, extent-size, missing-map, missing-file: no LUN with an id from 0 to 255 is known\n",
     "epinspect: --root: 'none': No such file or directory. Try …\n"
     "epinspect: LUN 0-255: none is known: …\nepinspect: none: no EP files found (EP_ERR_NO_PATH, 18990401)\n"},
    {"the journal", "rm own/var/db/iscsi/EP_JNL; epinspect --root own check", 3,
     "/var/db/iscsi/EP_JNL: LUN 1: missing-file: no file, but this LUN and 2 others need it\n10 files, 5376 entries, 1 "
     "finding: 1 missing-file\n" + snapshot, ""},
    {"the table of a map that is named, which another file replaces or which is gone",
     "cd own; E=volume2/@iSCSI/EP M=volume2/@iSCSI/LUN; cp $E/EP_TBL EP; cp $M/* $E/EP_TBL;"
     "epinspect --root . check $E/EP_TBL $M/* | head -n 1; rm $E/EP_TBL; epinspect --root . check $M/* | head -n 1; "
     "printf '\\3' | dd of=EP bs=1 seek=16 conv=notrunc status=none; mv EP $E/EP_TBL; epinspect --root . check 2;"
     " rm $E/EP_TBL; "
     "cp var/db/iscsi/EP_JNL $E/EP_DAT_00000; epinspect --root . check $M/*", 1,
     "volume2/@iSCSI/EP/EP_TBL: kind: type 4, a map file, but named like a table file\n"
     "/volume2/@iSCSI/EP/EP_TBL: LUN 2: missing-file: no file, but this LUN needs it\n"
     "/volume2/@iSCSI/EP/EP_TBL: kind: type 3, a data file, but named like a table file\n"
     "1 file, 256 entries, 1 finding: 1 kind\n" + uncompared + "/volume2/@iSCSI/EP/EP_TBL\n…",
     "epinspect: /volume2/@iSCSI/EP/EP_DAT_00000" + wrongType + "\n"},
    {"a table that a journal replaces",
     "cp own/var/db/iscsi/EP_JNL own/volume1/@iSCSI/EP/EP_TBL; epinspect --root own check", 3,
     table1 + ": kind: type 5, which the journal " + journal + " has too, but named like a table file\n"
     "11 files, 5376 entries, 1 finding: 1 kind\n" + snapshot + uncompared + table1 + " and 1 more\n", ""},
    {"one of two kinds with one type",
     "cd own; rm -r volume2; sed -i '/lid.: 2/,$d; s/},$/}]/' var/db/iscsi/luns.json; "
     "cp volume1/@iSCSI/EP/EP_FRI var/db/iscsi/EP_JNL; epinspect --root . check", 3,
     journal + ": kind: type 2, which the free-index file " + volume1 + "EP/EP_FRI has too, but named like a "
     "journal\n" +
     volume1 + "EP/EP_FRI: kind: type 2, which the journal " + journal + " has too, but named like a free-index file\n"
     "7 files, 5120 entries, 2 findings: 2 kind\nSnapshot: …", ""},
    {"a table with a type of its own, beside two that agree",
     "cd own; mkdir -p volume3/@iSCSI/EP; cp volume2/@iSCSI/EP/EP_TBL volume3/@iSCSI/EP; "
     "printf '\\11' | dd of=volume1/@iSCSI/EP/EP_TBL bs=1 seek=16 conv=notrunc status=none; "
     "epinspect --root . check; epinspect --root . check --json | grep -o 'stored.*otherFile\\|rules.:{[^}]*'", 0,
     table1 + ": kind: type 9, the table file /volume2/@iSCSI/EP/EP_TBL has 1\n"
     "12 files, 5376 entries, 1 finding: 1 kind\n" + snapshot + uncompared + table1 + " and 1 more\n"
     R"(stored":9,"found":1,"otherFile)" "\n" R"(rules":{"kind":1)" "\n", ""},
    {"a name of four digits",
     "cd own/volume2/@iSCSI/EP; mv EP_DAT_00000 EP_DAT_0000; epinspect --root ../../.. check", 3,
     lun2 + ": LUN 2: missing-data-file: 128 entries in 2 runs, first entries 0-63: extent 16 and others, but there is "
     "no EP_DAT_00000\n11 files, …\nNot compared: serial-number: not a name that the target gives to a data file: "
     "/volume2/@iSCSI/EP/EP_DAT_0000\n", ""},
    {"nothing, whatever extent size is given beside the LUNs' own", "epinspect --root own check --extent-size 1G", 0,
     "11 files, 5376 entries, 0 findings\n" + snapshot, ""},
};
// clang-format on

TEST_P(Losses, AreFound) { expect(GetParam()); }
INSTANTIATE_TEST_SUITE_P(, Losses, testing::ValuesIn(cases), nameOf);

TEST_F(Losses, AreNamedWhateverHappensToAFile) {
    struct Fault {
        const char* name;
        std::string command;  // F is the file, O one of another kind
        int status;
    };
    const Fault faults[] = {
        {"missing", ":", 3},
        {"unreadable", "ln .whole $F; chmod 0 $F", 1},
        {"empty", "> $F", 1},
        {"a folder", "mkdir $F", 1},
        {"a dead link", "ln -s x $F", 3},
        {"of a wrong type", "cp $O $F", 3},
    };
    const std::pair<std::string, std::string> files[] = {
        {journal, volume1 + "EP/EP_FRI"},
        {volume1 + "EP/EP_TBL", journal},
        {volume2 + "EP/EP_FRI", volume1 + "EP/EP_TBL"},
        {volume1 + "EP/EP_DAT_00000", journal},
        {volume1 + "EP/EP_DAT_00001", volume2 + "EP/EP_FRI"},
        {volume2 + "EP/EP_DAT_00000", lun2},
        {lun1, volume2 + "EP/EP_TBL"},
        {lun2, journal},
    };
    for (const auto& [file, other] : files) {
        for (const Fault& fault : faults) {
            const bool asUser = fault.name == std::string("unreadable");
            if (asUser && !canBeUser_) {
                std::cout << "not tried, no other user can run the program: " << file << ' ' << fault.name << '\n';
                continue;
            }
            const std::string command = "F=own" + file + " O=own" + other + "; mv $F .whole; " + fault.command + "; " +
                                        (asUser ? asUser_ : "") +
                                        "epinspect --root own check 2>&1; status=$?; "
                                        "rm -rf $F; mv .whole $F; chmod 644 $F; exit $status";
            const bool isLostData = fault.command == ":" && file.find("EP_DAT") != std::string::npos;
            const std::string named = isLostData ? "there is no " + file.substr(file.rfind('/') + 1) : file + ": ";
            SCOPED_TRACE(file + " " + fault.name);
            expect({"", command, fault.status, "…" + named + "…", ""});
        }
    }
    expect({"", "epinspect --root own check", 0, "11 files, 5376 entries, 0 findings\n" + snapshot, ""});
}

}  // namespace
