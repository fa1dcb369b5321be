// The stand-in for the platform's library: what it reads from its list, and how it refuses.
#include <fcntl.h>
#include <kelpiscsiep.h>
#include <malloc.h>
#include <sys/syscall.h>
#include <unistd.h>

#include <cstring>

#include "Support.h"

static constexpr int unknown = 9001, unreadable = 9002, malformed = 9003, bad = 9004;
static const char* machineList = "";    ///< what stands for /var/db/iscsi/luns.json
static int allocationsLeft = -1;        ///< operator new fails when none is left; below 0: it does not
static std::size_t held = 0, most = 0;  ///< bytes of memory, now and at most

extern "C" __attribute__((visibility("default"))) int open(const char* path, int flags, ...) {
    const bool ofMachine = std::strcmp(path, "/var/db/iscsi/luns.json") == 0;
    return static_cast<int>(syscall(SYS_openat, AT_FDCWD, ofMachine ? machineList : path, flags, 0600));
}

[[gnu::noinline]] void* operator new(std::size_t size) {
    void* memory = allocationsLeft == 0 ? nullptr : std::malloc(size);
    if (memory == nullptr) throw std::bad_alloc();
    if (allocationsLeft > 0) --allocationsLeft;
    most = std::max(most, held += malloc_usable_size(memory));
    return memory;
}
[[gnu::noinline]] void operator delete(void* memory) noexcept { held -= malloc_usable_size(memory), std::free(memory); }
[[gnu::noinline]] void operator delete(void* memory, std::size_t) noexcept { operator delete(memory); }

TEST(StandIn, AnswersFromTheListAndRefusesClearly) {
    const TempDir folder;
    const std::string path = folder.path("luns.json");
    const std::string list =
        R"([{"lid": 7, "extentSize": 4294967295, "size": 9223372036854775809, "restoreTime": -2147483648, "type": -5,)"
        R"( "uuid": "U", "rootPath": "R", "name": "N"}, {"lid": 8, "name": "M"}])";
    std::string memory;
    const auto ask = [&memory] {  // the record does not lie on a multiple of 8, and what lies around it is spared
        memory.assign(KELPISCSI_LUN_RECORD_SIZE + 2, 'x');
        const int code = KELPiSCSILunGetByLid(7, 0, &memory[1]);
        return memory.front() == 'x' && memory.back() == 'x' ? code : -1;
    };
    const auto quoted = [](std::size_t length) { return '"' + std::string(length, 'x') + '"'; };
    setenv("KELPISCSIEP_LUNS", path.c_str(), 1);
    // clang-format off
    const std::tuple<int, std::string, Lines> cases[] = {  // the code, and what stands in the list instead of a text
        {0, "9223372036854775809", {"18446744073709551615"}}, {0, "-5", {"2147483647", R"(0, "more": {})"}},
        {bad, "9223372036854775809", {"18446744073709551616", "-1"}}, {bad, "-2147483648", {"-2147483649"}},
        {bad, "-5", {"2147483648", "18446744073709551611", "1.5", "[1]"}},
        {bad, "-5", {R"(1, "type": null)", R"(1, "type": true)", R"(1, "type": 1.5)", R"(1, "type": [])", R"(1, "type": {})"}},
        {bad, "4294967295", {"4294967296", "-1"}}, {bad, "\"name\"", {"\"other\""}}, {0, "\"U\"", {quoted(73)}},
        {bad, "\"U\"", {quoted(74), "3", "null"}}, {0, "\"R\"", {quoted(4094)}}, {bad, "\"R\"", {quoted(4095)}},
        {0, "\"N\"", {quoted(266), R"(3, "name": "N")", R"("N", "more": {"lid": 8, "list": [{"name": 3}]})"}},
        {bad, "\"N\"", {quoted(267), R"("\u0000")", R"("N", "name": 3)"}},
        // before the LUN stand LUNs with an id, behind it may stand anything
        {0, "[{", {R"([{"lid": 8}, {)"}}, {bad, "[{", {"[3, {", R"([{"lid": 8}, {}, {)", R"([{"lid": "8"}, {)"}},
        {0, "}]", {"}, 3, {}]"}}, {malformed, "}]", {"}", "}, 3", "}] 3", "}, \"\xff\"]"}},
        {malformed, "[{", {R"({"luns": [{)", std::string(100000, '[')}},
        {malformed, list, {list.substr(1, list.find("}, ")), ""}}, {unknown, "7", {"8"}}, {0, "7", {"7"}}};
    const std::pair<int, const char*> texts[] = {
        {0, "Success"}, {1, "Unknown error"}, {9001, "No such LUN"},
        {9002, "The LUN list is missing or cannot be read"}, {9003, "The LUN list is not a JSON array"},
        {9004, "The LUN list holds a value of the wrong type, or one that does not fit its field"}};
    // clang-format on
    for (const auto& [code, text] : texts) EXPECT_STREQ(text, KELPiSCSIStrError(code));
    for (const auto& [expected, from, replacements] : cases)
        for (const std::string& to : replacements) {
            std::ofstream(path) << std::string(list).replace(list.find(from), from.size(), to);
            EXPECT_EQ(expected, ask()) << from << " -> " << to.substr(0, 80);
        }
    for (const std::string& other :
         {folder.path("none"), folder.path(""), std::string("/dev/zero"), std::string("/proc/self/mem")})
        EXPECT_EQ(unreadable, (setenv("KELPISCSIEP_LUNS", other.c_str(), 1), ask())) << other;

    unsetenv("KELPISCSIEP_LUNS");
    machineList = path.c_str();
    close(STDIN_FILENO);  // a list may get any descriptor
    ASSERT_EQ(0, ask());
    EXPECT_EQ(0, memory.compare(21, 20, "\xff\xff\xff\xff\x01\0\0\0\0\0\0\x80\0\0\0\x80\xfb\xff\xff\xff", 20));
    EXPECT_EQ(std::string("U\0R\0N", 6), memory.substr(45, 2) + memory.substr(119, 2) + memory.substr(4214, 2));

    std::ofstream longList(path);  // of which one LUN is held at a time; without memory for that it cannot be read
    for (int i = 0; i < 20000; ++i) longList << (i == 0 ? '[' : ',') << R"({"lid": 9, "name": "one of a long list"})";
    longList << ',' << list.substr(1) << std::flush;
    most = held;
    EXPECT_EQ(0, ask());
    EXPECT_GT(held + 65536, most);
    for (int allocations = 0; allocations < 4; ++allocations, allocationsLeft = -1) {
        allocationsLeft = allocations;
        EXPECT_EQ(unreadable, ask());
    }
}
