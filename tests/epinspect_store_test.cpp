// epinspect list, locate and read: what lies in a store, and where the bytes of its LUNs are.
#include <sys/syscall.h>

#include <cerrno>

#include "InProcess.h"
#include "ProgramTest.h"
#include "store/ExtentPlace.h"

static std::int64_t badPosition = -1;  ///< in every file; what holds it cannot be read
static int badResult = -1;             ///< of such a read; 0: the file ends there

// read() itself, whatever a hardened build makes of that name.
ssize_t readAroundBadPosition(int descriptor, void* bytes, std::size_t size) __asm__("read");
__attribute__((visibility("default"))) ssize_t readAroundBadPosition(int descriptor, void* bytes, std::size_t size) {
    const std::int64_t position = lseek(descriptor, 0, SEEK_CUR);
    if (position > badPosition || badPosition - position >= static_cast<std::int64_t>(size)) {
        return syscall(SYS_read, descriptor, bytes, size);
    }
    errno = EIO;
    return badResult;
}

namespace {

using inspection::positionOf;

constexpr std::uint64_t mapped = 0x8000000000000000, MiB = 1048576, TiB4 = 4398046511104;

std::string placeIn(std::uint64_t address, std::uint32_t extentSize) {
    const auto place = inspection::placeOf(address, extentSize);
    if (!place) return "none";
    return std::to_string(place->dataFile) + " " + std::to_string(place->inFile) + " " + std::to_string(place->next);
}

TEST(ExtentPlace, IsDataFileAndExtentInItBeforeTheNextFilesFirst) {
    EXPECT_EQ("1 514 8388608", placeIn(4194818, 1048576));
    EXPECT_EQ("0 1398101 1398102", placeIn(1398101, 3145728));  // lies across the end of the data file
    EXPECT_EQ("1 0 2049", placeIn(1025, 4294967295));
    EXPECT_EQ("2097151 4194303 8796093022208", placeIn(8796093022207, 1048576));  // ends at byte 2^63
    EXPECT_EQ("none", placeIn(8796093022208, 1048576));
    EXPECT_EQ("none", placeIn(0, 0));
}

TEST(ExtentPlace, HasPositionsBelowTwoToThe63) {
    EXPECT_EQ(4398586535680U, positionOf(24576, 4194818, 1048576, 1031936));
    EXPECT_EQ(9223372036854775807U, positionOf(0, 8796093022207, 1048576, 1048575));
    EXPECT_EQ(std::nullopt, positionOf(1, 8796093022207, 1048576, 1048575));
    EXPECT_EQ(std::nullopt, positionOf(9223372036854775808U, 0, 1, 0));
}

const std::string ep = "/volume91/@iSCSI/EP/EP_DAT_0000", maps = "/volume91/@iSCSI/LUN/";
const std::string uuid = "00000000-0000-4000-8000-000000000005", lun5 = maps + "THIN" + uuid + "five_00000";

/// Beside the sample store the store `far`: LUN 5 of 6 MiB on volume 12, whose map has entries for 5, and LUN 6.
class Store : public ProgramTest {
protected:
    Store() {
        EPFileBuilder map = EPFileBuilder::map().entry(0, mapped | 4194303).entry(1, mapped | 4194304);
        map.entry(2, mapped | 0x1000000000002).entry(3, mapped | 8388608).entry(4, mapped | 3);
        write("far" + lun5, map);
        EPFileBuilder data1 = EPFileBuilder::data().bytes(24576, "here").bytes(24576 + TiB4, "there");
        write("far" + ep + "1", data1.resize(24576 + TiB4 + MiB / 2));
        EPFileBuilder data0 = EPFileBuilder::data().bytes(24576 + 2 * MiB, "two").bytes(24576 + 3 * MiB, "three");
        write("far" + ep + "0", data0.resize(24576 + 7 * MiB / 2));
        std::filesystem::create_directories(path("far/var/db/iscsi"));
        const std::string same = R"(,"size":6291456,"restoreTime":0,"type":7,"uuid":")" + uuid + R"(","rootPath":"/)";
        std::ofstream(path("far/var/db/iscsi/luns.json"))
            << R"([{"lid":5,"extentSize":1048576)" << same << R"(volume91","name":"five"},{"lid":6,"extentSize":0)"
            << same << R"(other","name":""}])";
    }
};

const std::string assumed = "assumed: entry i holds bytes from i x extent size", file = R"({"kind":"file","file":")";
const std::string openFailed = " (EP_ERR_OPEN_FAILED, 18990038)\n";
const std::string no = "THIN00000000-0000-4000-8000x000000000005_00000",
                  same = R"(","fileKind":"map","size":24616,"missing":false,"entries":5})";
const std::string notFound = "cannot be opened: No such file or directory" + openFailed;
const std::string beyond0 = "past the end, the file holds 3670016 bytes of extents (EP_ERR_READ_FAILED, 18990039)\n";
const std::string open2 =
    "bits 48 to 51 are set: extent 2 of pool 1 with --address-bits 48, extent 281474976710658 of "
    "pool 0 with --address-bits 52 (EP_ERR_NO_PATH, 18990401)\n";

// clang-format off
const Case cases[] = {
    {"list tells what lies in a store", "epinspect --root store list", 0,
     "jnl         24576  /var/db/iscsi/EP_JNL\ntbl         24576  /volume1/@iSCSI/EP/EP_TBL\nfri  …00000\n"
     "dat    6442475520  /volume1/@iSCSI/EP/EP_DAT_00001\nmap         57344  LUN 1  4096 entries\n"
     "      BLUN 6f1c1d0a-58d3-4e0f-9b51-2f7a9c5e0d11 lun1\n"
     "      /volume1/@iSCSI/LUN/BLUN6f1c1d0a-58d3-4e0f-9b51-2f7a9c5e0d11lun1_00000\nmap         32768  LUN 3  …\n"
     "tbl   …2/@iSCSI/EP/EP_TBL\nfri   …2/@iSCSI/EP/EP_FRI\ndat      16801792  /volume2/@iSCSI/EP/EP_DAT_00000\n"
     "map         26624  LUN 2  256 entries\n…lun2_00000\n", ""},
    {"list tells what LUNs lack", "mkdir far/volume3; for v in 091 -91 91x; do ln -s volume91 far/volume$v; "
     "done; epinspect --root far list --luns 5-6; epinspect --root far list --luns 6 --json | tail -n 1", 0,
     "jnl       missing  /var/db/iscsi/EP_JNL\ntbl       missing  /volume91/@iSCSI/EP/EP_TBL\n"
     "fri       missing  /volume91/@iSCSI/EP/EP_FRI\ndat       3694592  " + ep + "0\ndat 4398047059968  " + ep + "1\n"
     "map         24616  LUN 5  5 entries\n      THIN " + uuid + " five\n      " + lun5 + "\n"
     "map       missing  LUN 6  THIN " + uuid + "\n      /other/@iSCSI/LUN/THIN" + uuid + "_00000\n" + file +
     "/other/@iSCSI/LUN/THIN" + uuid + R"(_00000","lid":6,"fileKind":"map","size":null,"missing":true,)"
     R"("typeName":"THIN","uuid":")" + uuid + R"(","name":""})" "\n", ""},
    {"list needs no LUN list", "cd far/volume91/@iSCSI; mv EP/*0 EP/EP_DAT_99999; >EP/EP_DAT_100000; "
     "rm -r ../../var EP/*1; for n in " + no + " a-b a-$(printf %040d 0)_00000; do cp LUN/*five* LUN/$n; done; "
     "epinspect --root ../.. list --json", 0,
     file + ep.substr(0, ep.size() - 4) + R"(99999","fileKind":"dat","size":3694592,"missing":false})" "\n" +
     file + ep.substr(0, ep.size() - 4) + R"(100000","fileKind":"dat","size":0,"missing":false})" "\n" +
     file + lun5 + R"(","fileKind":"map","size":24616,"missing":false,"entries":5,"typeName":"THIN","uuid":")" + uuid +
     R"(","name":"five"})" "\n" + file + maps + no + same + "\n" +
     file + maps + "a-" + std::string(40, '0') + "_00000" + same + "\n" + file + maps + "a-b" + same + "\n",
     "epinspect: LUN 0-255: none is known: The LUN list ../../var/db/iscsi/luns.json is missing or cannot be read: No "
     "such file or directory (code 9002)\n"},
    {"list says what may not be opened", "rm far/var/db/iscsi/*; cd far/volume91/@iSCSI; mv EP LUN/folder; "
     "ln -s ../../../usr EP; rm LUN/THIN*; mkfifo LUN/pipe; ln -s none LUN/link; ln -s self LUN/self; "
     "epinspect --root ../.. list --luns 7; epinspect --root LUN/folder list", 1,
     "map       missing  " + maps + "link  link to none\n",
     "epinspect: LUN 7: configuration cannot be loaded: The LUN list ../../var/db/iscsi/luns.json is missing or cannot "
     "be read: No such file or directory (code 9002)\n"
     "epinspect: /volume91/@iSCSI/EP: cannot be opened: a link leads out of the folder of --root" + openFailed +
     "epinspect: " + maps + "pipe: cannot be opened: neither a regular file nor a block device (…)\n"
     "epinspect: " + maps + "self: cannot be opened: Too many levels of symbolic links (…)\n"
     "…LUN/folder: no EP files found (…"},
    {"locate finds bytes", "epinspect --root store locate 1 540000000 430000000 18446744073709551615", 1,
     "LUN 1 byte 540000000: entry 514, byte 1031936 of its extent\n514: mapped, pool 16, extent 4194818\n"
     "/volume1/@iSCSI/EP/EP_DAT_00001 position 540024576 (extent 514 of the file)\n" + assumed + "; extents counted "
     "within the data file (counted from the volume's start they would lie past its end)\n"
     "LUN 1 byte 430000000: entry 410, byte 83840 of its extent\n410: hole\n" + assumed +
     "; what is not mapped reads as zeros\n",
     "…: LUN 1 byte 18446744073709551615: past the end, the LUN has 4294967296 bytes…"},
    {"locate writes JSON", "epinspect --root store locate 1 540000000 --json", 0,
     R"({"kind":"place","file":"/volume1/@iSCSI/LUN/BLUN…lun1_00000","lid":1,"lunOffset":540000000,"index":514,)"
     R"("remainder":1031936,"entryOffset":28688,"extentAddress":4194818,"poolNumber":16,"mapped":true,"vpushed":false,)"
     R"("vpulled":false,"synced":false,"candidates":[{"countFrom":"file","dataFile":"/volume1/@iSCSI/EP/EP_DAT_00001",)"
     R"("extent":514,"position":540024576,"inside":true},{"countFrom":"volume","dataFile":"/volume1/@iSCSI/EP/)"
     R"(EP_DAT_00001","extent":4194818,"position":4398586535680,"inside":false}]})" "\n", ""},
    {"locate names both where the format is ambiguous", "T='epinspect --root far locate 5'; $T 1048577; "
     "$T 2M --address-bits 48; $T 2M; $T 2M --address-bits 52", 1,
     "LUN 5 byte 1048577: entry 1, byte 1 of its extent\n…\n" +
     ep + "1 position 24577 (extent 0 of the file, counted within it)\n" +
     ep + "1 position 4398046535681 (extent 4194304 of the file, counted from the volume's start)\n" + assumed +
     "; ambiguous: both places lie inside the data file, --count-from decides\n"
     "LUN 5 byte 2097152: entry 2, byte 0 of its extent\n2: mapped, pool 1, extent 281474976710658\n" +
     ep + "0 position 2121728 (extent 2 of the file)\n" + assumed + "; extent 2, as --address-bits says\n…",
     "epinspect: LUN 5 byte 2097152: " + open2 +
     "epinspect: LUN 5 byte 2097152: position out of any file's range (EP_ERR_SEEK_FAILED, 18990041)\n"},
    {"locate says what is not there", "epinspect --root far locate 5 4718592 >o; echo $?;"
     " epinspect --root far locate 5 3M --count-from volume 4718592 5M; "
     "epinspect --root far locate 5 1M --count-from file | tail -n 1; "
     "epinspect --root far locate 5 3M --count-from volume --json 2>/dev/null | grep -o '\"extent\":.*'", 0,
     "1\n…\n" + ep + "2 position unknown (extent 8388608 of the file)\n" + assumed +
     "; extents counted from the volume's "
     "start, as --count-from says\n…\n" + ep + "0 position 3694592 (extent 3 of the file), past its end\n…\n" +
     assumed + "; extents counted within the data file, as --count-from says\n"
     R"("extent":8388608,"position":null,"inside":false}]})" "\n",
     "epinspect: " + ep + "0: LUN 5 byte 4718592: " + beyond0 + "epinspect: " + ep + "2: LUN 5 byte 3145728: " +
     notFound +
     "epinspect: " + ep + "0: LUN 5 byte 4718592: " + beyond0 + "…" + lun5 +
     ": LUN 5 byte 5242880: past the end, the map's entries stand for 5242880 bytes (…)\n"},
    {"read gets all that can be had", "epinspect --root far read 5 >image; echo $?; wc -c <image; "
     "grep -abo '[a-z][a-z]*' image; epinspect --root far read 5 --count-from file --address-bits 48 2>/dev/null | "
     "grep -abo '[a-z][a-z]*'", 0, "1\n6291456\n4194304:three\n1048576:here\n2097152:two\n4194304:three\n",
     "epinspect: " + ep + "0: LUN 5 bytes 0-1048575: " + beyond0 + "epinspect: " + ep +
     "1: LUN 5 bytes 1048576-1572863: ambiguous: extents may be counted within the data file or from the volume's "
     "start, and both places lie inside the file; --count-from decides …\n"
     "epinspect: LUN 5 bytes 2097152-3145727: " + open2 +
     "epinspect: " + ep + "2: LUN 5 bytes 3145728-4194303: " + notFound + "epinspect: " + ep + "0: LUN 5 bytes "
     "4718592-5242879: " + beyond0 + "epinspect: " + lun5 + ": LUN 5 bytes 5242880-6291455: past the end, …\n"
     "epinspect: LUN 5: 5242880 of 6291456 bytes could not be read, zeros stand in their place\n"},
    {"read reaches beyond four TiB", "T='epinspect --root far read --count-from volume'; $T 5 --offset 1M --length 5; "
     "$T --extent-size 1M " + lun5 + " --offset 1048578 --length 0x1; "
     "epinspect --root far read 5 --count-from file --offset 512K --length 524292 2>/dev/null | tail -c 4", 0,
     "thereehere", ""},
    {"read follows runs and holes", "epinspect --root store read 2 --offset 9371640 | grep -abo 'extent [0-9]*' | "
     "awk -F: '!seen[$2]++'", 0, "15:extent 80\n65551:extent 128\n3145743:extent 175\n", ""},
    {"neither goes beyond the LUN", "for a in 'read 5 --offset 6M' 'read 5 --length 7M' 'read 6' 'read 7'; "
     "do epinspect --root far $a; echo $?; done; "
     "cp far" + lun5 + " m; epinspect read m --extent-size 1M --length 1 | od -An -tx1", 0, "1\n1\n1\n1\n 00\n",
     "…byte 6291456: past the end, the LUN has 6291456 bytes (…: LUN 6: extent size cannot be used (…"
     "No such LUN…epinspect: m: byte 0: path names no volume (…1 of 1 bytes…"},
    {"wrong usage is named", "for a in 'read none' 'read 4294967296' 'locate 5 1x' 'locate 5 1 --address-bits 50'; "
     "do epinspect $a; done; epinspect read 5 --count-from LUN", 2, "",
     "epinspect: none: cannot be opened: No such file or directory (EP_ERR_OPEN_FAILED, 18990038)\n…"
     "MAP: '4294967296'…"
     "OFFSET: '1x'…--address-bits: '50': not 48 or 52…--count-from: 'LUN': not file or volume…"},
};
// clang-format on

}  // namespace

TEST_F(Store, ReadLosesNoMoreThanWhatCannotBeRead) {
    EPFileBuilder data = EPFileBuilder::data().bytes(24576 + 3 * MiB, std::string(700000, 'x'));
    write("far" + ep + "0", data.resize(24576 + 4 * MiB));
    std::vector<const char*> words = {"read", "5", "--offset=4194404", "--length=600000"};
    const auto expectRead = [&](int result, std::int64_t bad, const std::string& read, const std::string& lost) {
        EXPECT_EQ(1, run([&] {
                      std::tie(badResult, badPosition) = std::pair(result, bad);
                      const std::string root = path("far");
                      words.insert(words.begin(), {"", "--root", root.c_str()});
                      _exit(runHere(words));
                  }));
        EXPECT_TRUE(fits(content(".out"), read));
        EXPECT_TRUE(
            fits(content(".err"), "epinspect: " + lost + " bytes could not be read, zeros stand in their place\n"));
    };
    // Of the extent's blocks of 4096 bytes number 72; the bytes asked for start at byte 100 of the extent. Then the
    // map.
    const std::string zeros(600000, '\0'), all = lun5 + ": LUN 5 bytes 4194404-4794403: ";
    const std::string reason = "cannot be read: Input/output error (EP_ERR_READ_FAILED, 18990039)";
    expectRead(-1, 24576 + 3 * MiB + 298000,
               std::string(294812, 'x') + std::string(4096, '\0') + std::string(301092, 'x'),
               ep + "0: LUN 5 bytes 4489216-4493311: " + reason + "…LUN 5: 4096 of 600000");
    expectRead(
        0, 24576 + 3 * MiB + 298000, zeros,
        ep + "0: LUN 5 bytes 4194404-4794403: the file has become shorter while it was read (…: 600000 of 600000");
    expectRead(-1, 24576 + 32, zeros, all + reason + "…LUN 5: 600000 of 600000");
    expectRead(0, 24576 + 32, zeros, all + "the file has become shorter while it was read (…LUN 5: 600000 of 600000");
    // A block of a map is 512 entries.
    std::string entries;
    for (std::uint64_t i = 0; i < 6144; ++i) entries += epbuilder::littleEndian(mapped | (3072 + i % 1024), 8);
    write("far" + lun5, EPFileBuilder::map().bytes(24576, entries));
    words = {"read", "5", "--extent-size=1K", "--length=1200000"};
    const std::string before(524288, 'x'), after(151424, 'x');
    expectRead(-1, 24576 + 4096 + 32, before + std::string(524288, '\0') + after,
               lun5 + ": LUN 5 bytes 524288-1048575: " + reason + "…LUN 5: 524288 of 1200000");
}

TEST_P(Store, DoesAsPromised) { expect(GetParam()); }
INSTANTIATE_TEST_SUITE_P(Cases, Store, testing::ValuesIn(cases), nameOf);
