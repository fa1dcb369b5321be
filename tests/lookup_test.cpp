// The lookups beyond the header block: map entries and extents.
#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileMAP.h>

#include <array>
#include <limits>
#include <map>

#include "Support.h"

using namespace ISCSI::TOOL;
using epbuilder::EPFileBuilder;
namespace head0 = epbuilder::head0;

namespace {

constexpr std::uint64_t blockSize = 24576;
constexpr std::uint64_t maximum = std::numeric_limits<std::uint64_t>::max();

/// The lines at which a lookup logs, and the size of what it looks up.
struct Lookup {
    std::string source, operation;
    int header, type, open, seek, read;
    std::uint64_t itemSize;
    bool failsAtEnd = true;  ///< at or beyond the end of the file
    bool seeks = true;       ///< to a position that may be out of range
};

/// Drives one lookup into each of its failures. `find(file, index)` gives its code, or -1 when a failed call has
/// touched the result.
template <typename File, typename Find>
void expectFailures(const Lookup& lookup, const EPFileBuilder& valid, Find find) {
    const TempDir folder;
    takeLog();
    const auto expectFailure = [&](File& file, std::uint64_t index, int code, int line, const std::string& message,
                                   Lines lines = {}) {
        EXPECT_EQ(code, find(file, index)) << index;
        lines.push_back(lookup.source + ":" + std::to_string(line) + ":" + lookup.operation + " " + message);
        EXPECT_EQ(chain(file.path, lines), takeLog()) << index;
    };
    File missing(folder.path("missing"));
    expectFailure(
        missing, 0, 18990038, lookup.header, "Failed to parse header.",
        {"ISCSIEPFile.cpp:37:readHeader Failed to open file.", "ISCSIEPFile.cpp:59:parseHead0 Failed to read header."});
    for (const int type : {0, 1, 7, -1}) {  // the stored number is shown as signed
        EPFileBuilder other = valid;
        other.set(head0::type, static_cast<std::uint32_t>(type)).resize(blockSize + 4096);
        File file(folder.write("other", other));
        expectFailure(file, 0, 18990400, lookup.type, "Wrong EP file type: " + std::to_string(type) + ".");
    }
    // Two items and all but the last byte of a third.
    EPFileBuilder builder = valid;
    File file(folder.write("file", builder.resize(blockSize + 3 * lookup.itemSize - 1)));
    EXPECT_EQ(0, find(file, 1));
    const std::uint64_t beyond[] = {2, 3, 0x100000001};
    for (const auto index : beyond) {
        if (lookup.failsAtEnd) expectFailure(file, index, 18990039, lookup.read, "Failed to read file.");
    }
    for (const std::uint64_t position : {std::uint64_t{1} << 63, maximum - 2 * blockSize}) {
        if (!lookup.seeks) continue;
        expectFailure(file, position / lookup.itemSize, 18990041, lookup.seek, "Failed to seek to offset.");
    }
    EXPECT_EQ(0, find(file, maximum / lookup.itemSize + 1 - blockSize / lookup.itemSize));  // position 0, modulo 2^64
    std::filesystem::resize_file(file.path, 100);                                           // HEAD[0] is known by now
    if (lookup.failsAtEnd) expectFailure(file, 1, 18990039, lookup.read, "Failed to read file.");
    std::filesystem::remove(file.path);
    expectFailure(file, 1, 18990038, lookup.open, "Failed to open file.");
}

}  // namespace

TEST(Lookup, EachStepFailsWithItsOwnLineAndCodeAndLeavesTheResult) {
    const auto getMapEntry = [](ISCSIEPFileMAP& file, std::uint64_t index) {
        ISCSIEPMapEntryInfo entry(1, 2, true, true, true, true);
        const std::string before = entry.toString();
        const int code = file.getMapEntry(index, entry);
        return code == 0 || entry.toString() == before ? code : -1;
    };
    const auto getMapEntries = [](ISCSIEPFileMAP& file, std::uint64_t index) {
        std::vector<ISCSIEPMapEntryInfo> entries(3);
        const int code = file.getMapEntries(index, 1, entries);
        return code == 0 || entries.size() == 3 ? code : -1;
    };
    const auto getEntryCount = [](ISCSIEPFileMAP& file, std::uint64_t /*index*/) {
        unsigned long long count = 7;
        const int code = file.getEntryCount(count);
        return code == 0 || count == 7 ? code : -1;
    };
    const auto getExtentBytes = [](ISCSIEPFileDAT& file, std::uint64_t index) {
        unsigned char bytes[512];
        return file.getExtentBytes(index, 512, 0, 512, bytes);
    };
    const auto getExtentData = [](ISCSIEPFileDAT& file, std::uint64_t index) {
        std::string data = "old";
        const int code = file.getExtentData(index, 512, data);
        return code == 0 || data == "old" ? code : -1;
    };
    const EPFileBuilder map = EPFileBuilder::map();
    expectFailures<ISCSIEPFileMAP>({"ISCSIEPFileMAP.cpp", "getMapEntry", 172, 176, 180, 185, 189, 8}, map, getMapEntry);
    expectFailures<ISCSIEPFileMAP>({"ISCSIEPFileMAP.cpp", "getMapEntries", 201, 202, 203, 204, 205, 8, false}, map,
                                   getMapEntries);
    expectFailures<ISCSIEPFileMAP>({"ISCSIEPFileMAP.cpp", "getEntryCount", 211, 212, 213, 214, 215, 8, false, false},
                                   map, getEntryCount);
    expectFailures<ISCSIEPFileDAT>({"ISCSIEPFileDAT.cpp", "getExtentBytes", 102, 103, 104, 105, 106, 512},
                                   EPFileBuilder::data(), getExtentBytes);
    expectFailures<ISCSIEPFileDAT>({"ISCSIEPFileDAT.cpp", "getExtentData", 69, 73, 77, 82, 87, 512},
                                   EPFileBuilder::data(), getExtentData);
}

TEST(MapEntry, BitsBecomeMembersAndALine) {
    // clang-format off
    const std::map<std::uint64_t, std::string> lines = {  // after "pool number: "
        {0, "0 ,extent address: 0 ,mapped: false ,vpushed: false ,vpulled: false ,synced: false"},
        {0x8000000000000400, "0 ,extent address: 1024 ,mapped: true ,vpushed: false ,vpulled: false ,synced: false"},
        {0x100000000000002a, "0 ,extent address: 42 ,mapped: false ,vpushed: false ,vpulled: false ,synced: true"},
        {0xd000000000001000, "0 ,extent address: 4096 ,mapped: true ,vpushed: true ,vpulled: false ,synced: true"},
        {0x2ff0ffffffffffff,
         "4080 ,extent address: 281474976710655 ,mapped: false ,vpushed: false ,vpulled: true ,synced: false"},
        {0x0001000000000000,
         "1 ,extent address: 281474976710656 ,mapped: false ,vpushed: false ,vpulled: false ,synced: false"},
        {maximum, "4095 ,extent address: 4503599627370495 ,mapped: true ,vpushed: true ,vpulled: true ,synced: true"}};
    // clang-format on
    const TempDir folder;
    EPFileBuilder builder = EPFileBuilder::map();
    std::uint64_t index = 0;
    for (const auto& [stored, line] : lines) builder.entry(index++, stored);
    ISCSIEPFileMAP file(folder.write("map", builder));
    EXPECT_EQ("pool number: 0 ,extent address: 0 ,mapped: false ,vpushed: false ,vpulled: false ,synced: false\n",
              ISCSIEPMapEntryInfo().toString());
    std::vector<ISCSIEPMapEntryInfo> entries;
    EXPECT_EQ(0, file.getMapEntries(0, maximum, entries));
    ASSERT_EQ(lines.size(), entries.size());
    index = 0;
    for (const auto& [stored, line] : lines) {
        ISCSIEPMapEntryInfo entry;
        EXPECT_EQ(0, file.getMapEntry(index, entry));
        EXPECT_EQ("pool number: " + line + "\n", entry.toString());
        EXPECT_EQ(entry.toString(), entries[static_cast<std::size_t>(index++)].toString());
    }
}

TEST(MapEntry, RunsOfEntriesEndWithTheFile) {
    constexpr std::uint64_t total = 20000;  // several reads
    const TempDir folder;
    EPFileBuilder builder = EPFileBuilder::map();
    std::string content;
    for (std::uint64_t i = 0; i < total; ++i) content += epbuilder::littleEndian(i, 8);
    ISCSIEPFileMAP file(folder.write("map", builder.bytes(blockSize, content + "7 bytes")));
    using Case = std::array<std::uint64_t, 3>;
    // The last count once made the walk endless: eight times it is 0, modulo 2^64.
    for (const auto& [first, count, expected] :
         {Case{0, 0, 0}, Case{total, 0, 0}, Case{total, 1, 0}, Case{total + 8192, maximum, 0}, Case{0, 1, 1},
          Case{0, 8192, 8192}, Case{5, 8193, 8193}, Case{0, total, total}, Case{0, total + 1, total},
          Case{total - 1, maximum, 1}, Case{1, maximum, total - 1}, Case{total - 16384, 16385, 16384},
          Case{0, std::uint64_t{1} << 63, total}}) {
        std::vector<ISCSIEPMapEntryInfo> entries(7);
        EXPECT_EQ(0, file.getMapEntries(first, count, entries));
        ASSERT_EQ(expected, entries.size()) << first << ' ' << count;
        if (entries.empty()) continue;
        EXPECT_EQ(first, entries.front().extentAddress);
        EXPECT_EQ(first + expected - 1, entries.back().extentAddress);
    }
}

TEST(MapEntry, TheCountFollowsTheEndOfTheFileAndTheDataStart) {
    const TempDir folder;
    using Case = std::array<std::uint64_t, 3>;  // data start offset, size of the file, whole entries
    for (const auto& [start, size, expected] :
         {Case{blockSize, blockSize + 8 * 678 + 7, 678}, Case{blockSize, blockSize, 0},
          Case{blockSize, blockSize + 7, 0}, Case{0, blockSize, 3072}, Case{blockSize + 1, blockSize, 0},
          Case{maximum, blockSize + 8, 0}, Case{0x100000008, 0x100000028, 4}, Case{0x100000008, blockSize + 80, 0}}) {
        EPFileBuilder builder = EPFileBuilder::map().set(head0::dataStartOffset, start);
        ISCSIEPFileMAP file(folder.write("map", builder.resize(size)));
        unsigned long long count = 7;
        EXPECT_EQ(0, file.getEntryCount(count));
        EXPECT_EQ(expected, count) << start << ' ' << size;
    }
}

TEST(Extent, MarksComeOutFromBeyondThe32BitRange) {
    const std::map<char, std::uint64_t> marks = {{'0', 0},          {'1', 0x7fffffff},  {'2', 0x80000000},
                                                 {'3', 0xffffffff}, {'4', 0x100000000}, {'5', 0x140000123}};
    const TempDir folder;
    EPFileBuilder builder = EPFileBuilder::data();
    for (const auto& [mark, offset] : marks) builder.bytes(blockSize + offset, std::string(1, mark));
    ISCSIEPFileDAT file(folder.write("data", builder));
    std::string data;
    for (const auto& [mark, offset] : marks) {
        EXPECT_EQ(0, file.getExtentData(offset, 1, data));
        EXPECT_EQ(std::string("3") + mark, data);
    }
    EXPECT_EQ(0, file.getExtentData(0x1000, 0x100000, data));  // the product of index and size needs 64 bits
    EXPECT_EQ(std::string("34") + std::string(0x200000 - 2, '0'), data);
}

TEST(Extent, EveryByteBecomesItsDigitsWhateverTheSize) {
    std::string content, digits;
    for (unsigned int i = 0; i < 256 * 97; ++i) {  // every value in every place, and more than one read
        content.push_back(static_cast<char>(i * 3));
        digits.append(1, "0123456789abcdef"[i * 3 / 16 % 16]).append(1, "0123456789abcdef"[i * 3 % 16]);
    }
    const TempDir folder;
    ISCSIEPFileDAT file(folder.write("data", EPFileBuilder::data().bytes(blockSize, content)));
    for (const unsigned int size : {1U, 15U, 31U, 32U, 33U, 63U, 64U, 256U * 97}) {
        std::string data;
        EXPECT_EQ(0, file.getExtentData(0, size, data));
        EXPECT_EQ(digits.substr(0, std::size_t{2} * size), data);
    }
}

TEST(Extent, BytesComeOutInFileOrderAndSizesAreChecked) {
    const TempDir folder;
    const std::string bytes("\x00\x0f\xa0\xff\x12\x34", 6);
    ISCSIEPFileDAT file(folder.write("data", EPFileBuilder::data().bytes(blockSize, bytes)));
    std::string data = "old";
    EXPECT_EQ(0, file.getExtentData(0, 4, data));
    EXPECT_EQ("000fa0ff", data);
    EXPECT_EQ(0, file.getExtentData(1, 3, data));
    EXPECT_EQ("ff1234", data);
    std::string part(3, 'x');
    auto* to = reinterpret_cast<unsigned char*>(part.data());
    EXPECT_EQ(0, file.getExtentBytes(1, 3, 1, 2, to));
    EXPECT_EQ("\x12\x34x", part);
    EXPECT_EQ(0, file.getExtentBytes(0, 4294967295, 3, 3, to));
    EXPECT_EQ("\xff\x12\x34", part);
    EXPECT_EQ(0, file.getExtentBytes(0, 3, 3, 0, nullptr));
    using Part = std::array<unsigned int, 2>;
    for (const auto& [offset, length] : {Part{0, 4}, Part{4, 0}, Part{3, 1}, Part{2, 0xffffffff}}) {
        EXPECT_EQ(18990003, file.getExtentBytes(0, 3, offset, length, to));
        EXPECT_EQ(chain(file.path, {"ISCSIEPFileDAT.cpp:107:getExtentBytes Invalid part of an extent: " +
                                    std::to_string(length) + " bytes from " + std::to_string(offset) + "."}),
                  takeLog());
    }
    EXPECT_EQ(18990003, file.getExtentBytes(0, 3, 0, 1, nullptr));
    EXPECT_EQ(18990507, ISCSIEPFileDAT("none").getExtentBytes(0, 0, 9, 9, nullptr));
    EXPECT_EQ(chain("none", {"ISCSIEPFileDAT.cpp:101:getExtentBytes Invaild LUN extent size: 0."}),
              Lines{takeLog()[1]});
    EXPECT_EQ("\xff\x12\x34", part);
    EXPECT_EQ(0U, file.serialNumber);  // HEAD[1] is not decoded by a lookup
    ISCSIEPFileDAT missing(folder.path("missing"));
    EXPECT_EQ(18990507, missing.getExtentData(0, 0, data));
    EXPECT_EQ(0, errno);
    EXPECT_EQ(chain(missing.path, {"ISCSIEPFileDAT.cpp:65:getExtentData Invaild LUN extent size: 0."}), takeLog());
    for (const unsigned int size : {0x7fffffffU, 0x80000000U, 0xffffffffU}) {
        EXPECT_EQ(18990038, missing.getExtentData(0, size, data));
        // Where a pointer has 32 bits no text of that size can be held, elsewhere the file ends too early.
        EXPECT_EQ(sizeof(void*) == 4 ? 18990507 : 18990039, file.getExtentData(0, size, data));
    }
    EXPECT_EQ("ff1234", data);
}
