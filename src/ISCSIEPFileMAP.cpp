#include "ISCSIEPFileMAP.h"

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <exception>
#include <iterator>
#include <memory>
#include <optional>
#include <utility>

#include "DumpText.h"
#include "EPLayout.h"
#include "EPLookup.h"
#include "LittleEndian.h"
#include "etc/ISCSIEPFormat.h"
#include "etc/ISCSIEPLog.h"
#include "etc/ISCSIQuorinStringTool.h"

namespace ISCSI::TOOL {

namespace {

constexpr std::size_t entriesPerRead = 8192;

constexpr EPLookupIdentity entryLookup = EPLookupIdentity(EP_LOG_FILE, "getMapEntry", EP_FILE_TYPE_MAP)
                                             .parseFailsAt(172)
                                             .typeFailsAt(176)
                                             .openFailsAt(180)
                                             .seekFailsAt(185)
                                             .readFailsAt(189);
constexpr EPLookupIdentity entriesLookup = EPLookupIdentity(EP_LOG_FILE, "getMapEntries", EP_FILE_TYPE_MAP)
                                               .parseFailsAt(201)
                                               .typeFailsAt(202)
                                               .openFailsAt(203)
                                               .seekFailsAt(204)
                                               .readFailsAt(205);
constexpr EPLookupIdentity countLookup = EPLookupIdentity(EP_LOG_FILE, "getEntryCount", EP_FILE_TYPE_MAP)
                                             .parseFailsAt(211)
                                             .typeFailsAt(212)
                                             .openFailsAt(213)
                                             .seekFailsAt(214)
                                             .readFailsAt(215);

ISCSIEPMapEntryInfo decodeEntry(const unsigned char* bytes) {
    const std::uint64_t entry = le64(bytes);
    return {entry & EP_MAP_ENTRY_ADDRESS_MASK,
            static_cast<unsigned int>((entry & EP_MAP_ENTRY_POOL_MASK) >> EP_MAP_ENTRY_POOL_SHIFT),
            (entry & EP_MAP_ENTRY_MAPPED) != 0,
            (entry & EP_MAP_ENTRY_VPUSHED) != 0,
            (entry & EP_MAP_ENTRY_VPULLED) != 0,
            (entry & EP_MAP_ENTRY_SYNCED) != 0};
}

/// Appends the text of the UUID at `bytes` to `list`. Returns 0 or EP_ERR_BAD_UUID.
int appendUUID(const unsigned char* bytes, std::vector<std::string>& list) {
    std::string text;
    const int error = GetUUIDInString(bytes, text);
    if (error != 0) return error;
    try {
        list.push_back(std::move(text));
    } catch (const std::exception&) {
        errno = ENOMEM;
        return EP_ERR_BAD_UUID;
    }
    return 0;
}

/// Goes through the entries that stored bytes hold.
class StoredEntries {
public:
    using iterator_category = std::forward_iterator_tag;
    using value_type = ISCSIEPMapEntryInfo;
    using difference_type = std::ptrdiff_t;
    using pointer = const value_type*;
    using reference = value_type;

    explicit StoredEntries(const unsigned char* bytes) : bytes_(bytes) {}
    value_type operator*() const { return decodeEntry(bytes_); }
    StoredEntries& operator++() {
        bytes_ += EP_MAP_ENTRY_SIZE;
        return *this;
    }
    bool operator!=(const StoredEntries& other) const { return bytes_ != other.bytes_; }
    bool operator==(const StoredEntries& other) const { return bytes_ == other.bytes_; }

private:
    const unsigned char* bytes_;
};

/// Appends entries from `stream` to `run` until it holds `count`, or all up to the end of the file. False on an error.
bool readEntries(EPFileStream& stream, std::uint64_t count, std::vector<ISCSIEPMapEntryInfo>& run) {
    const auto blockEntries = static_cast<std::size_t>(std::min<std::uint64_t>(count, entriesPerRead));
    const std::unique_ptr<unsigned char[]> block(new unsigned char[blockEntries * EP_MAP_ENTRY_SIZE]);
    while (run.size() < count) {
        const auto wanted = static_cast<std::size_t>(std::min<std::uint64_t>(count - run.size(), blockEntries));
        const std::optional<std::size_t> got = stream.readUpTo(block.get(), wanted * EP_MAP_ENTRY_SIZE);
        if (!got) return false;
        const std::size_t arrived = *got / EP_MAP_ENTRY_SIZE;
        const unsigned char* end = block.get() + arrived * EP_MAP_ENTRY_SIZE;
        run.insert(run.end(), StoredEntries(block.get()), StoredEntries(end));
        if (arrived < wanted) break;
    }
    return true;
}

}  // namespace

ISCSIEPFileMAP::ISCSIEPFileMAP() : ISCSIEPFileMAP(std::string()) {}

ISCSIEPFileMAP::ISCSIEPFileMAP(const std::string& filePath) : ISCSIEPFile(filePath) {}

ISCSIEPFileMAP::~ISCSIEPFileMAP() = default;

int ISCSIEPFileMAP::parseFile() {
    int error = parseHead0();
    if (error != 0) {
        EP_LOG_ERR(63, "Failed to get parse HEAD[0]. path: %s", path.c_str());
        return error;
    }
    const unsigned char* head1 = headerBlock + EP_HEAD1;
    head1Checksum = le32(head1);
    attribute = le32(head1 + 4);
    logicBlockSize = le32(head1 + 8);
    totalCount = le64(head1 + 12);
    error = GetUUIDInString(head1 + 20, parentUUID);
    if (error != 0) {
        EP_LOG_ERR(84, "Failed to get HEAD[1] parent UUID. path: %s", path.c_str());
        return error;
    }
    parentTotalCount = le64(head1 + 36);

    const unsigned char* var0 = headerBlock + EP_VAR0;
    var0Checksum = le32(var0);
    mappedCount = le64(var0 + 4);

    const unsigned char* var1 = headerBlock + EP_VAR1;
    var1Checksum = le32(var1);
    seg0Checksum = le32(var1 + 4);
    seg0PoolCount = le32(var1 + 8);
    error = GetUUIDInString(var1 + 12, sessionUUID);
    if (error != 0) {
        EP_LOG_ERR(114, "Failed to get VAR[1] session UUID. path: %s", path.c_str());
        return error;
    }
    promoteTime = le32(var1 + 28);

    const unsigned char* var2 = headerBlock + EP_VAR2;
    var2Checksum = le32(var2);
    syncCount = le64(var2 + 4);
    childAttribute = le32(var2 + 12);
    error = GetUUIDInString(var2 + 16, trackUUID);
    if (error != 0) {
        EP_LOG_ERR(136, "Failed to get VAR[2] track UUID. path: %s", path.c_str());
        return error;
    }
    error = GetUUIDInString(var2 + 32, previousTrackUUID);
    if (error != 0) {
        EP_LOG_ERR(140, "Failed to get VAR[2] previous track UUID. path: %s", path.c_str());
        return error;
    }
    error = GetUUIDInString(var2 + 48, currentTrackUUID);
    if (error != 0) {
        EP_LOG_ERR(144, "Failed to get VAR[2] current track UUID. path: %s", path.c_str());
        return error;
    }

    const std::size_t poolCount = std::min(seg0PoolCount, EP_POOL_COUNT_MAX);
    for (std::size_t i = 0; i < poolCount; ++i) {
        error = appendUUID(headerBlock + EP_SEG0 + i * EP_UUID_SIZE, poolUUIDs);
        if (error != 0) {
            EP_LOG_ERR(152, "Failed to get SEG[0] #%zu pool UUID. path: %s", i, path.c_str());
            return error;
        }
    }
    return 0;
}

int ISCSIEPFileMAP::getMapEntry(unsigned long long index, ISCSIEPMapEntryInfo& entry) {
    EPFileStream stream;
    const int error = seekToItem(*this, stream, entryLookup, index * EP_MAP_ENTRY_SIZE);
    if (error != 0) return error;
    unsigned char bytes[EP_MAP_ENTRY_SIZE];
    if (!stream.read(bytes, sizeof bytes)) return readFailed(*this, entryLookup);
    entry = decodeEntry(bytes);
    return 0;
}

int ISCSIEPFileMAP::getMapEntries(unsigned long long first, unsigned long long count,
                                  std::vector<ISCSIEPMapEntryInfo>& entries) {
    std::vector<ISCSIEPMapEntryInfo> run;
    if (count > 0) {
        EPFileStream stream;
        const int error = seekToItem(*this, stream, entriesLookup, first * EP_MAP_ENTRY_SIZE);
        if (error != 0) return error;
        try {
            if (!readEntries(stream, count, run)) return readFailed(*this, entriesLookup);
        } catch (const std::exception&) {
            errno = ENOMEM;
            return readFailed(*this, entriesLookup);
        }
    }
    entries.swap(run);
    return 0;
}

int ISCSIEPFileMAP::getEntryCount(unsigned long long& count) {
    EPFileStream stream;
    const int error = openForLookup(*this, stream, countLookup);
    if (error != 0) return error;
    const std::optional<std::uint64_t> end = stream.seekToEnd();
    if (!end) return seekFailed(*this, countLookup);
    count = *end > head0DataStartOffset ? (*end - head0DataStartOffset) / EP_MAP_ENTRY_SIZE : 0;
    return 0;
}

std::string ISCSIEPFileMAP::toString() const {
    constexpr std::size_t textSize = 1024;
    constexpr std::size_t poolLineSize = 64;
    DumpText text(ISCSIEPFile::toString(), textSize + poolLineSize * poolUUIDs.size());
    text.section("HEAD[1]")
        .hex("checksum", head1Checksum)
        .hex("attribute", attribute)
        .dec("logic block size", logicBlockSize)
        .dec("total count", totalCount)
        .text("parent UUID", parentUUID)
        .dec("parent total count", parentTotalCount)
        .section("VAR[0]")
        .hex("checksum", var0Checksum)
        .dec("mapped count", mappedCount)
        .section("VAR[1]")
        .hex("checksum", var1Checksum)
        .hex("seg0 checksum", seg0Checksum)
        .dec("seg0 pool count", seg0PoolCount)
        .text("session UUID", sessionUUID)
        .time("promote time", promoteTime)
        .section("VAR[2]")
        .hex("checksum", var2Checksum)
        .dec("sync count", syncCount)
        .hex("child attribute", childAttribute)
        .text("track UUID", trackUUID)
        .text("previous track UUID", previousTrackUUID)
        .text("current track UUID", currentTrackUUID)
        .section("SEG[0]");
    unsigned long long number = 0;
    for (const std::string& poolUUID : poolUUIDs) text.item("pool", ++number, poolUUID);
    return text.str();
}

}  // namespace ISCSI::TOOL
