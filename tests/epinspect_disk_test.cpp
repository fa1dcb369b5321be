// A LUN as a disk: any range of it as a value, and its image with holes.
#include <sys/stat.h>

#include <cerrno>
#include <csignal>
#include <random>

#include "InProcess.h"
#include "ProgramTest.h"
#include "store/LunBytes.h"

static int writesAllowed = -1;           ///< of an image; then writeFails() is called. Negative: all
static std::function<int()> writeFails;  ///< returns the errno value

// pwrite() itself, as programs with 64-bit file positions call it.
ssize_t writeToImage(int descriptor, const void* bytes, std::size_t size, off64_t position) __asm__("pwrite64");
__attribute__((visibility("default"))) ssize_t writeToImage(int descriptor, const void* bytes, std::size_t size,
                                                            off64_t position) {
    if (writesAllowed == 0) errno = writeFails();
    if (writesAllowed == 0) return -1;
    if (writesAllowed > 0) --writesAllowed;
    if (lseek64(descriptor, position, SEEK_SET) < 0) return -1;
    return write(descriptor, bytes, std::min<std::size_t>(size, 100000));
}

namespace {

namespace fs = std::filesystem;
using inspection::LunPart;

constexpr std::uint64_t mapped = 0x8000000000000000, MiB = 1048576;
const std::string lun = "/volume1/@iSCSI/LUN/m", data = "/volume1/@iSCSI/EP/EP_DAT_0000";
const std::string ofFour = "epinspect --root four read " + lun + " --extent-size 1M ";
const std::string ofDisk = "epinspect --root disk read 1 ";
const std::string cannotOpen = "cannot be opened: No such file or directory (EP_ERR_OPEN_FAILED, 18990038)";

/// In the store `four` a LUN of 4 GiB, of which 3 MiB are mapped, one of them zeros; in the store `disk` LUN 1, made of
/// the file `image`: 6 MiB less an extent of 64 KiB, with zeros in between.
class Disk : public ProgramTest {
protected:
    Disk() {
        unsetenv("KELPISCSIEP_LUNS");
        write("four" + lun, EPFileBuilder::map().entry(1, mapped).entry(1000, mapped | 2).entry(4095, mapped | 1));
        EPFileBuilder file = EPFileBuilder::data().bytes(24576, std::string(MiB, 'a'));
        write("four" + data + "0", file.bytes(24576 + 2 * MiB, std::string(MiB, 'c')));
        EPFileBuilder many = EPFileBuilder::map(), missing = EPFileBuilder::map();
        for (std::uint64_t i = 0; i < 10000; ++i) missing.entry(i, mapped | i);
        for (std::uint64_t i = 0; i < 70; ++i) many.entry(i, mapped | (i + 10) << 30U);
        write("many" + lun, many);
        write("many" + lun + "2", missing);
        fs::create_directories(path("many/volume1/@iSCSI/EP"));
        std::mt19937 random(20);
        for (std::size_t i = 0; i < 6 * MiB - 65536; ++i)
            image_ += static_cast<char>(i / 65536 % 12 < 4 ? 0 : random());
        std::ofstream(path("image"), std::ios::binary) << image_;
        EXPECT_EQ(0, run("epsample --disk image disk"));
    }

    std::string image_;
};

// clang-format off
const Case cases[] = {
    {"an image takes no more room than its data", "large " + ofFour + "--output i; stat -c %s i; "
     "[ $(du -k i | cut -f1) -lt 3200 ] || du -k i; for e in 0 1 1000 4094 4095; do "
     "dd if=i bs=1M skip=$e count=1 status=none | tr -s 'ac\\0' | tr '\\0' 0; done", 0,
     "i: 4294967296 bytes: 3145728 data, 4291821568 holes, 0 missing\n4294967296\n0ac00", ""},
    {"an image is what read writes", "for a in '' '--offset 100 --length 2M' '--length 0'; do " + ofDisk +
     "$a --output i && " + ofDisk + "$a | cmp - i; rm i; done; " + ofDisk + "| cmp - image", 0,
     "i: 6225920 bytes: 4194304 data, 2031616 holes, 0 missing\n"
     "i: 2097152 bytes: 1310820 data, 786332 holes, 0 missing\ni: 0 bytes: 0 data, 0 holes, 0 missing\n", ""},
    {"an image never takes the place of a file", "echo kept >i; ln -s none l; mkdir d; for f in i l d no/x ''; do " +
     ofDisk + "--output \"$f\"; echo $?; done; cat i; ls none", 2, "1\n1\n1\n1\n1\nkept\n",
     says({"i: cannot be made: File exists", "l: cannot be made: File exists", "d: cannot be made: File exists",
           "no/x: cannot be made: No such file or directory", "'': cannot be made: No such file or directory"}) +
     "ls: …\n"},
    {"the missing ranges of an image are known", "rm disk" + data + "1; truncate -s 1M disk" + data + "2; " + ofDisk +
     "--output i --json 2>err; echo $?; grep -c . err; tail -n 1 err; stat -c %s i", 0,
     R"({"kind":"missing","file":"/volume1/@iSCSI/LUN/THIN…disk_00000","lid":1,"lunOffset":524288,"length":262144,)"
     R"("message":")" + data + "1: LUN 1 bytes 524288-786431: " + cannotOpen + "\"}\n…"
     R"({"kind":"missing",…,"lunOffset":1048576,"length":524288,"message":")" + data +
     "2: LUN 1 bytes …: past the end, the file holds 1024000 bytes of extents (…)\"}\n…"
     R"({"kind":"summary","file":"…","lid":1,"summary":true,"output":"i","bytes":6225920,"data":2007040,)"
     R"("holes":2031616,"missing":2187264,"changed":[]})" "\n1\n9\n"
     "epinspect: LUN 1: 2187264 of 6225920 bytes could not be read, zeros stand in their place\n6225920\n", ""},
    {"no image is left of what holds nothing", "rm four" + data + "0; " + ofFour +
     "--offset 1M --length 5 --output i; echo $?; rm disk" + data + "*; (ulimit -f 100; " + ofDisk +
     "--output i); echo $?; ls", 0, "1\n1\ndisk\nfour\nimage\nmany\nstore\n",
     says({data + "0: bytes 1048576-1048580: …", "i: removed, nothing could be read",
           "i: removed, nothing was written to it: File too large"})},
    {"an interrupted read reports what is missing before it ends", "rm disk" + data + "1; mkfifo p; " + ofDisk +
     "--offset 640K >p & exec 3<p; head -c 1 <&3 >byte; kill -TERM $!; wait $!; echo $?", 0, "143\n",
     says({data + "1: LUN 1 bytes 655360-786431: " + cannotOpen}) + "…"},
    {"JSON is of an image only", ofDisk + "--json", 2, "",
     says({"--json needs --output. Try 'epinspect read --help'."})},
    {"bytes are read on where only the flags change", "large epinspect --root store read 1 --output i "
     "--offset 783M --length 18M", 0, "i: 18874368 bytes: 17825792 data, 1048576 holes, 0 missing\n", ""},
    {"a LUN may lie in many data files", "for i in $(seq 10 79); do "
     "cp four" + data + "0 many/volume1/@iSCSI/EP/EP_DAT_000$i; done; "
     "epinspect --root many read " + lun + " --extent-size 4K | tr -d a | wc -c", 0, "0\n", ""},
    {"a long range that is missing is one", "epinspect --root many read " + lun + "2 --extent-size 512 | wc -c", 0,
     "5120000\n", says({data + "0: bytes 0-5119999: " + cannotOpen,
     lun + "2: 5120000 of 5120000 bytes could not be read, zeros stand in their place"})},
    {"holes are as long as they are", "truncate -s 200K four" + lun + "; large epinspect --root four read " + lun +
     " --extent-size 512 --output i", 0, "i: 11534336 bytes: 1536 data, 11532800 holes, 0 missing\n", ""},
    {"an image whose end nobody hears of is incomplete", "rm disk" + data + "1; " + ofDisk +
     "--output i --json >/dev/full; stat -c %s i", 0, "2424832\n",
     says({data + "1: LUN 1 bytes 524288-786431: " + cannotOpen, data + "1: LUN 1 bytes 2097152-2359295: " + cannotOpen,
           "i: incomplete, it holds the first 2424832 of 6225920 bytes", "standard output: No space left on device"})},
    {"an image is whole when nobody hears of it", ofDisk + "--output i --json >/dev/full; echo $?; cmp i image", 0,
     "1\n", says({"standard output: No space left on device"})},
};
// clang-format on

TEST_P(Disk, DoesAsPromised) { expect(GetParam()); }
INSTANTIATE_TEST_SUITE_P(Cases, Disk, testing::ValuesIn(cases), nameOf);

TEST_F(Disk, AnImageThatCannotBeFinishedKeepsWhatIsRight) {
    const auto read = [this](int writes, const std::function<int()>& fails) {
        return run([&] {
            fs::current_path(path(""));
            std::tie(writesAllowed, writeFails) = std::pair(writes, fails);
            _exit(runHere({"", "--root", "disk", "read", "1", "--offset", "256K", "--output", "i"}));
        });
    };
    EXPECT_EQ(1, read(0, [] { return ENOSPC; }));
    EXPECT_EQ(says({"i: removed, nothing was written to it: No space left on device"}), content(".err"));
    EXPECT_FALSE(fs::exists(path("i")));
    EXPECT_EQ(1, read(2, [] { return ENOSPC; }));
    EXPECT_EQ(says({"i: incomplete, it holds the first 200000 of 5963776 bytes: No space left on device"}),
              content(".err"));
    const std::string begun = content("i");
    EXPECT_TRUE(begun == image_.substr(262144, 200000)) << begun.size();
    fs::remove(path("i"));
    EXPECT_EQ(1, read(3, [] {
                  writesAllowed = raise(SIGINT) - 1;
                  return EINTR;
              }));
    EXPECT_TRUE(fits(content(".err"), says({"i: interrupted: incomplete, it holds the first … of 5963776 bytes"})));
    EXPECT_TRUE(content("i").size() > begun.size() && image_.find(content("i")) == 262144) << content("i").size();
}

/// Keeps failures and remarks.
struct Listener : inspection::Context {
    void report(const inspection::Failure& failure) override { ADD_FAILURE() << messageOf(failure); }
    void remark(const std::string& subject, const std::string& /*text*/) override { remarks += subject + "\n"; }
    void progress(const char* /*things*/, std::uint64_t /*done*/, std::uint64_t /*total*/) override {}
    void trying(bool /*begins*/) override {}

    std::string remarks;
};

TEST_F(Disk, AnyRangeIsReadAsTheStoreIsNow) {
    Listener context;
    ASSERT_FALSE(context.setRoot(path("disk")));
    const auto opened = openLunMap(context, {1, ""}, std::nullopt);
    ASSERT_TRUE(opened);
    const inspection::LunMap copy = opened->copy();
    inspection::LunBytes bytes(context, copy, {});

    // Runs of 8 extents lie in turn in three data files, in each from its end to its start.
    std::string parts;
    bytes.forEachPart(1, 1000000, [&](const LunPart& part) {
        parts += std::to_string(static_cast<int>(part.kind)) + " " + std::to_string(part.offset) + " " +
                 std::to_string(part.length) + " " + std::to_string(part.dataFile) + " " +
                 std::to_string(part.position) + "\n";
        return parts.size() < 60;
    });
    EXPECT_EQ("1 1 262143 0 0\n0 262144 262144 0 1835008\n0 524288 262144 1 1572864\n", parts);

    /// The bytes of random ranges are the image's or are missing; returns the sum of the lengths that are.
    std::mt19937 random(4);
    const auto check = [&](const std::string& failure) {
        std::uint64_t lost = 0;
        for (int i = 0; i < 200; ++i) {
            const std::size_t offset = random() % image_.size();
            const std::size_t length = std::min<std::size_t>(random() % 300000, image_.size() - offset);
            std::string expected = image_.substr(offset, length);
            std::string got(length, '?');
            const auto miss = [&](const LunPart& part) {
                lost += part.length;
                const auto at = static_cast<std::size_t>(part.offset - offset);
                const auto count = static_cast<std::size_t>(part.length);
                expected.replace(at, count, count, '\0');
                EXPECT_NE(std::string::npos, messageOf(bytes.failureOf(part)).find(failure));
                return true;
            };
            EXPECT_TRUE(bytes.read(offset, length, reinterpret_cast<unsigned char*>(got.data()), miss));
            EXPECT_EQ(expected, got) << offset << ' ' << length;
        }
        return lost;
    };
    EXPECT_EQ(0U, check(""));
    const std::string file = path("disk" + data + "1"), away = path("away");
    fs::rename(file, away);
    EXPECT_LT(1000000U, check(data + "1: LUN 1 bytes "));
    std::ofstream(file) << "no data file";
    EXPECT_LT(1000000U, check(data + "1: LUN 1 bytes "));
    fs::rename(away, file);
    EXPECT_EQ(0U, check(""));
    for (const std::string& replaced : {file, copy.map->path}) {
        fs::rename(replaced, away);
        EXPECT_EQ(0, mkfifo(replaced.c_str(), 0600));  // whoever opens that waits for ever
        EXPECT_LT(1000000U, check(": neither a regular file nor a block device"));
        fs::rename(away, replaced);
        EXPECT_EQ(0U, check(""));
    }
    const auto size = fs::file_size(file);
    fs::resize_file(file, 24576 + 1572864 + 100001);  // after the look at it that found this part
    std::string rest(262144, '?'), lost;
    const auto miss = [&](const LunPart& part) { return !(lost += messageOf(bytes.failureOf(part))).empty(); };
    bytes.readData({LunPart::Kind::data, 524288, 262144, 1, 1572864}, reinterpret_cast<unsigned char*>(rest.data()),
                   miss);
    EXPECT_EQ(image_.substr(524288, 100001) + std::string(162143, '\0'), rest);
    EXPECT_EQ(data +
                  "1: LUN 1 bytes 624289-786431: past the end, the file holds 1672865 bytes of extents "
                  "(EP_ERR_READ_FAILED, 18990039)",
              lost);
    fs::resize_file(file, size / 2);
    EXPECT_LT(100000U, check(": past the end, the file holds "));
    fs::resize_file(file, size);  // what was cut off reads as zeros now, without a failure
    fs::remove_all(path("disk"));
    EXPECT_LT(10000000U, check(cannotOpen));
    EXPECT_EQ(data + "1\n", context.remarks);
}

}  // namespace
