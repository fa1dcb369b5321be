// A map that changes while epinspect walks it: every command that walks says so.
#include <dirent.h>
#include <dlfcn.h>
#include <sys/syscall.h>

#include <cerrno>
#include <tuple>
#include <utility>

#include "InProcess.h"
#include "ProgramTest.h"

static int namesLeft = -1;             ///< of folders; after them reading a folder fails; below 0: it does not
static std::function<void()> happens;  ///< once, when the second block of a map's entries is about to be read

// read() itself, whatever a hardened build makes of that name.
ssize_t readInAStoreInUse(int descriptor, void* bytes, std::size_t size) __asm__("read");
__attribute__((visibility("default"))) ssize_t readInAStoreInUse(int descriptor, void* bytes, std::size_t size) {
    if (happens && lseek(descriptor, 0, SEEK_CUR) == 24576 + 8 * 4096) std::exchange(happens, {})();
    return syscall(SYS_read, descriptor, bytes, size);
}

dirent64* readdirOfABadDisk(DIR* folder) __asm__("readdir64");
__attribute__((visibility("default"))) dirent64* readdirOfABadDisk(DIR* folder) {
    static const auto system = reinterpret_cast<decltype(&readdirOfABadDisk)>(dlsym(RTLD_NEXT, "readdir64"));
    if (namesLeft > 0) --namesLeft;
    if (namesLeft != 0) return system(folder);
    errno = EIO;
    return nullptr;
}

namespace {

namespace fs = std::filesystem;

class Changes : public ProgramTest {
protected:
    /// Runs epinspect on the map "m" of 8192 entries, to which `change` happens.
    int run(std::vector<const char*> words, const std::function<void()>& change) const {
        namespace map = epbuilder::map;
        EPFileBuilder file = EPFileBuilder::map().set(map::totalCount, 8192).set(map::mappedCount, 0);
        write("m", file.set(map::syncCount, 0).entry(8191, 5));
        fs::last_write_time(path("m"), before_);
        const pid_t child = fork();
        if (child == 0) {
            fs::current_path(path(""));
            if (std::freopen(".out", "w", stdout) == nullptr || std::freopen(".err", "w", stderr) == nullptr) _exit(99);
            unsetenv("KELPISCSIEP_LUNS");
            happens = change;
            words.insert(words.begin(), "epinspect");
            const int status = runHere(words);
            _exit(happens && change ? 98 : status);
        }
        int status = 0;
        EXPECT_EQ(child, waitpid(child, &status, 0));
        return exitStatus(status);
    }

    const fs::file_time_type before_ = fs::file_time_type::clock::now() - std::chrono::hours(1);
};

TEST_F(Changes, AreNoticedByEveryCommandThatWalks) {
    const auto writeAt = [](std::streamoff position) {
        std::fstream("m", std::ios::in | std::ios::out).seekp(position) << "x";
    };
    const std::pair<const char*, std::function<void()>> changes[] = {
        {"nothing", {}},
        {"it grows within one tick of the clock",
         [&] {
             fs::resize_file("m", 24576 + 8 * 8193);
             fs::last_write_time("m", before_);
         }},
        {"entries are rewritten within a second",
         [&] {
             writeAt(24576);
             fs::last_write_time("m", before_ + std::chrono::nanoseconds(1));
         }},
        {"the header is rewritten within one tick of the clock",
         [&] {
             writeAt(24575);
             fs::last_write_time("m", before_);
         }},
        {"its like takes its place",
         [&] {
             fs::copy("m", "new");
             fs::last_write_time("new", before_);
             fs::rename("new", "m");
         }},
        {"it shrinks", [] { fs::resize_file("m", 24576 + 8 * 4097); }},
    };
    write("none", EPFileBuilder::map());
    write("volume1/@iSCSI/EP/EP_DAT_00000", EPFileBuilder::data());
    fs::create_directories(path("volume1/@iSCSI/LUN"));
    fs::create_symlink("../../../m", path("volume1/@iSCSI/LUN/m"));
    const char* const inStore = "/volume1/@iSCSI/LUN/m";
    const char* const data = "/volume1/@iSCSI/EP/EP_DAT_00000";
    for (const auto& [what, change] : changes) {
        const bool whole = what != std::string("it shrinks");
        for (const auto& [words, status, name] : std::vector<std::tuple<std::vector<const char*>, int, std::string>>{
                 {{"map", "m", "--json"}, 0, "m"},
                 {{"diff", "m", "none", "--json"}, 3, "m"},
                 {{"find", "m", "--json", "--pool", "7"}, 0, "m"},
                 {{"diff", "none", "m", "--json"}, 3, "m"},
                 {{"entry", "m", "0-8191", "--json"}, 0, "m"},
                 {{"read", "m", "--extent-size", "512", "--output", "i", "--json"}, 0, "m"},
                 {{"check", "m", "--json"}, 3, "m"},
                 {{"usage", "--root", ".", "--json", "--extent-size", "1M"}, 0, inStore},
                 {{"owner", "--root", ".", "--extent-size", "1M", data, "0"}, 0, inStore}}) {
            fs::remove(path("i"));
            EXPECT_EQ(whole ? status : 1, run(words, change)) << words[0] << ": " << what;
            const std::string says = !change ? "" : "epinspect: " + name + ": has changed while it was read\n";
            const std::string before = whole && name == "m" ? "" : "…";
            EXPECT_TRUE(fits(content(".err"), before + says + (whole ? "" : "…"))) << words[0] << ": " << what;
            const std::string changed = !change ? "" : "\"" + name + "\"";
            const bool isPassing = words[0] == std::string("check") && change;
            const bool isShort = words[0] == std::string("check") && !whole;
            const std::string rest =
                isShort ? "…total-count, mapped-count, sync-count: not all entries could be read: m…" : "…";
            const std::string list = (isPassing ? "…\"passing\":true" : "") + ("…\"changed\":[" + changed + "]…");
            const bool hasSummary = words[0] != std::string("owner") && words[0] != std::string("entry");
            EXPECT_TRUE(fits(content(".out"), whole && hasSummary ? list : rest)) << words[0] << ": " << what;
        }
    }
}

TEST_F(Changes, OfAMapThatWasWalkedBeforeCastDoubtOnWhatItShares) {
    write("first", EPFileBuilder::map().entry(0, 0x8000000000000005));
    write("second", EPFileBuilder::map().entry(0, 0x8000000000000005).entry(8191, 0));
    run({"check", "first", "second"}, [] { fs::resize_file("first", 24576); });
    EXPECT_TRUE(fits(content(".err"), "epinspect: first: has changed while it was read\n"));
    EXPECT_TRUE(
        fits(content(".out"), "…\nNot compared: shared-extents: a map has changed while it was read: first\n…"));
}

TEST_F(Changes, OfADataFileCastDoubtOnEntriesThatPointIntoIt) {
    const std::string lun = "/volume1/@iSCSI/LUN/x", data = "/volume1/@iSCSI/EP/EP_DAT_0000";
    namespace map = epbuilder::map;
    EPFileBuilder file =
        EPFileBuilder::map().set(map::totalCount, 8192).set(map::mappedCount, 3).set(map::syncCount, 0);
    file.entry(0, 0x8000000000000000).entry(1, 0x8000000040000000);
    write("r" + lun, file.entry(8191, 0x8000000000000001));
    EPFileBuilder held = EPFileBuilder::data();
    write("r" + data + "0", held.resize(24576 + 4096));
    const auto grow = [&] {
        fs::resize_file("r" + data + "0", fs::file_size("r" + data + "0") + 4096);
        fs::copy("r" + data + "0", "r" + data + "1", fs::copy_options::overwrite_existing);
    };
    run({"--root", "r", "check", lun.c_str(), "--extent-size", "4096"}, grow);
    EXPECT_EQ(says({data + "0: has changed while it was read", data + "1: has changed while it was read"}),
              content(".err"));
    EXPECT_TRUE(fits(content(".out"), lun + ": missing-data-file: entry 1: … (possibly passing: …)\n" + lun +
                                          ": beyond-data-file: entry 8191: … (possibly passing: …)\n1 file…"));
    run({"--root", "r", "read", lun.c_str(), "--extent-size", "512"}, grow);
    EXPECT_TRUE(fits(content(".err"), "…" + says({data + "0: has changed while it was read"}) + "…"));
}

TEST_F(Changes, OfADiskThatFailsInAFolderAreAFailure) {
    namesLeft = 3;
    const int status = ProgramTest::run([this] {
        _exit(chdir(path("").c_str()) + runHere({"", "--root", "store", "list"}));
    });
    namesLeft = -1;
    EXPECT_EQ(1, status);
    EXPECT_TRUE(fits(content(".err"), says({"/: cannot be opened: Input/output error (…)"}) + "…"));
}

}  // namespace
