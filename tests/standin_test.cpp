// The stand-in for the platform's library: what it reads from its list, and how it refuses.
#include <fcntl.h>
#include <kelpiscsiep.h>
#include <malloc.h>
#include <sys/mman.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <atomic>
#include <cstring>
#include <ctime>
#include <future>

#include "Support.h"

static constexpr int unknown = 9001, unreadable = 9002, malformed = 9003, bad = 9004;
static const char* machineList = "";  ///< what stands for /var/db/iscsi/luns.json
static std::time_t ahead = 0;         ///< of the real time
static std::atomic<std::size_t> readCalls{0}, bytesRead{0};
static std::atomic<int> allocationsLeft{-1};       ///< operator new fails when none is left; below 0: it does not
static std::atomic<std::size_t> held{0}, most{0};  ///< bytes of memory, now and at most

extern "C" __attribute__((visibility("default"))) int open(const char* path, int flags, ...) {
    const bool ofMachine = std::strcmp(path, "/var/db/iscsi/luns.json") == 0;
    return static_cast<int>(syscall(SYS_openat, AT_FDCWD, ofMachine ? machineList : path, flags, 0600));
}

extern "C" __attribute__((visibility("default"))) std::time_t time(std::time_t* /*result*/) {
    timespec now = {};
    clock_gettime(CLOCK_REALTIME, &now);
    return now.tv_sec + ahead;
}

extern "C" __attribute__((visibility("default"))) ssize_t read(int descriptor, void* bytes, std::size_t size) {
    if (++readCalls % 2 == 1) {
        errno = EINTR;
        return -1;
    }
    const auto count = syscall(SYS_read, descriptor, bytes, size);
    if (count > 0) bytesRead += static_cast<std::size_t>(count);
    return static_cast<ssize_t>(count);
}

[[gnu::noinline]] void* operator new(std::size_t size) {
    void* memory = allocationsLeft == 0 ? nullptr : std::malloc(size);
    if (memory == nullptr) throw std::bad_alloc();
    if (allocationsLeft > 0) --allocationsLeft;
    const std::size_t now = held += malloc_usable_size(memory);
    if (now > most) most = now;
    return memory;
}
[[gnu::noinline]] void operator delete(void* memory) noexcept {
    held -= malloc_usable_size(memory);
    std::free(memory);
}
[[gnu::noinline]] void operator delete(void* memory, std::size_t) noexcept { operator delete(memory); }

static const std::string list =
    R"([{"lid": 7, "extentSize": 4294967295, "size": 9223372036854775809, "restoreTime": -2147483648, "type": -5,)"
    R"( "uuid": "U", "rootPath": "R", "name": "N"}, {"lid": 8, "name": "M"}])";
static std::string memory;  ///< around the record, which does not lie on a multiple of 8

static int ask(unsigned int lid = 7) {
    memory.assign(KELPISCSI_LUN_RECORD_SIZE + 2, 'x');
    const int code = KELPiSCSILunGetByLid(lid, 0, &memory[1]);
    return memory.front() == 'x' && memory.back() == 'x' ? code : -1;
}

static int askOf(const std::string& path) {
    setenv("KELPISCSIEP_LUNS", path.c_str(), 1);
    return ask();
}

TEST(StandIn, AnswersFromTheListAndRefusesClearly) {
    const TempDir folder;
    const std::string path = folder.path("luns.json"), other = folder.path("other.json");
    const auto quoted = [](std::size_t length) { return '"' + std::string(length, 'x') + '"'; };
    // clang-format off
    const std::tuple<int, std::string, Lines> cases[] = {  // the code, and what stands in the list instead of a text
        {0, "9223372036854775809", {"18446744073709551615"}}, {0, "-5", {"2147483647", R"(0, "more": {})"}},
        {bad, "9223372036854775809", {"18446744073709551616", "-1"}}, {bad, "-2147483648", {"-2147483649"}},
        {bad, "-5", {"2147483648", "18446744073709551611", "1.5", "[1]"}},
        {bad, "-5", {R"(1, "type": null)", R"(1, "type": true)", R"(1, "type": [])", R"(1, "type": {})"}},
        {bad, "4294967295", {"4294967296", "-1"}}, {bad, "\"name\"", {"\"other\""}}, {0, "\"U\"", {quoted(73)}},
        {bad, "\"U\"", {quoted(74), "3", "null"}}, {0, "\"R\"", {quoted(4094)}}, {bad, "\"R\"", {quoted(4095)}},
        {0, "\"N\"", {quoted(266), R"(3, "name": "N")", R"("N", "more": {"lid": 8, "list": [{"name": 3}]})"}},
        {bad, "\"N\"", {quoted(267), R"("\u0000")", R"("N", "name": 3)"}},
        // before the LUN stand LUNs with an id, after it may stand anything
        {0, "[{", {R"([{"lid": 8}, {)"}}, {bad, "[{", {"[3, {", R"([{"lid": 8}, {}, {)", R"([{"lid": "8"}, {)"}},
        {0, "}]", {"}, 3, {}]"}}, {0, "{\"lid\": 8", {"{\"lid\": 7"}},
        {malformed, "}]", {"}", "}, 3", "}] 3", "}, \"\xff\"]"}},
        {malformed, "[{", {R"({"luns": [{)", std::string(100000, '[')}},
        {malformed, list, {list.substr(1, list.find("}, ")), ""}}, {unknown, "7", {"8"}}, {0, "7", {"7"}}};
    const std::pair<int, const char*> texts[] = {
        {0, "Success"}, {1, "Unknown error"}, {9001, "No such LUN"},
        {9002, "The LUN list L is missing or cannot be read"}, {9003, "The LUN list L is not a JSON array"},
        {9004, "The LUN list L holds a value of the wrong type, or one that does not fit its field"}};
    // clang-format on
    setenv("KELPISCSIEP_LUNS", "L", 1);
    for (const auto& [code, text] : texts) EXPECT_STREQ(text, KELPiSCSIStrError(code));
    std::ofstream(other) << "[]";
    for (const std::time_t time : {0, 3600})  // the list has just changed, and is read anew; or an hour ago
        for (const auto& [expected, from, replacements] : cases)
            for (const std::string& to : replacements) {
                ahead = time;
                if (time > 0) askOf(other);  // so that of the list before nothing is known any more
                std::ofstream(path) << std::string(list).replace(list.find(from), from.size(), to);
                EXPECT_EQ(expected, askOf(path)) << from << " -> " << to.substr(0, 80);
                const std::string first = memory;
                EXPECT_EQ(expected, ask()) << from << " -> " << to.substr(0, 80);
                EXPECT_EQ(first, memory);
            }
    for (const std::string& none :
         {folder.path("none"), folder.path(""), std::string("/dev/zero"), std::string("/proc/self/mem")})
        EXPECT_EQ(unreadable, askOf(none)) << none;

    ahead = 0;
    unsetenv("KELPISCSIEP_LUNS");
    machineList = path.c_str();
    close(STDIN_FILENO);  // a list may get any descriptor
    ASSERT_EQ(0, ask());
    EXPECT_EQ(0, memory.compare(21, 20, "\xff\xff\xff\xff\x01\0\0\0\0\0\0\x80\0\0\0\x80\xfb\xff\xff\xff", 20));
    EXPECT_EQ(std::string("U\0R\0N", 6), memory.substr(45, 2) + memory.substr(119, 2) + memory.substr(4214, 2));
}

TEST(StandIn, ReadsALongListOnceForAllThreadsAndKeepsLittleOfIt) {
    constexpr unsigned int count = 20000;
    const TempDir folder;
    const std::string path = folder.path("luns.json");
    std::ofstream file(path);
    for (unsigned int i = 0; i < count; ++i)
        file << (i == 0 ? '[' : ',') << R"({"lid": )" << i + 100 << R"(, "name": "one of a long list"})";
    file << ',' << list.substr(1) << std::flush;
    const auto size = static_cast<std::size_t>(std::filesystem::file_size(path));
    EXPECT_EQ(0, askOf(path));
    for (int allocations = 0; allocations < 4; ++allocations) {
        allocationsLeft = allocations;
        EXPECT_EQ(unreadable, ask());
    }
    allocationsLeft = -1;
    bytesRead = 0;
    EXPECT_EQ(0, ask());  // it has changed just now, which a further change might not show
    EXPECT_EQ(size, bytesRead);
    ahead = 3600;
    const std::size_t before = held;
    most = before;
    bytesRead = 0;
    const auto answersAreRight = [] {
        std::string record(KELPISCSI_LUN_RECORD_SIZE, 'x');
        bool right = true;
        for (const auto& [lid, code] : {std::pair(7U, 0), {8U, bad}, {100U, bad}, {count + 99, bad}, {99U, unknown}})
            right = right && KELPiSCSILunGetByLid(lid, 0, record.data()) == code;
        return right;
    };
    std::vector<std::future<bool>> threads(4);
    for (auto& thread : threads) thread = std::async(std::launch::async, answersAreRight);
    for (auto& thread : threads) EXPECT_TRUE(thread.get());
    EXPECT_GE(size + 4 * 4 * 16384, bytesRead);
    EXPECT_GT(before + 65536 + 48 * count, most);
    EXPECT_GT(before + 8192 + 16 * count, held);
    // A change through memory, which the file's state does not show; then one that it shows.
    const int descriptor = open(path.c_str(), O_RDWR);
    void* mapped = mmap(nullptr, size, PROT_READ | PROT_WRITE, MAP_SHARED, descriptor, 0);
    ASSERT_NE(MAP_FAILED, mapped);
    char* digit = static_cast<char*>(mapped) + (size - list.size() + list.find('7'));
    for (const char lid : {'7', '6'}) {
        *digit = lid;
        EXPECT_EQ(lid == '7' ? 0 : unknown, ask());
    }
    EXPECT_EQ(0, munmap(mapped, size) + close(descriptor));
    EXPECT_EQ(0, ask(6));
    file << " 3" << std::flush;
    EXPECT_EQ(malformed, ask());
}
