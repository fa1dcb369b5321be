// Makes EP files of every kind from named fields.
#pragma once

#include <array>
#include <cstdint>
#include <map>
#include <string>
#include <string_view>

namespace epbuilder {

/// Where a number lies in an EP file: byte offset and width (4 or 8).
struct Field {
    std::uint64_t offset;
    unsigned int width;
};

/// Where the 16 bytes of a UUID lie.
struct UUIDField {
    std::uint64_t offset;
};

namespace head0 {
inline constexpr Field checksum{0, 4}, version{4, 4}, magicCode{8, 8}, type{16, 4}, dataStartOffset{36, 8},
    createTime{44, 4};
inline constexpr UUIDField uuid{20};
}  // namespace head0

namespace tbl {
inline constexpr Field head1Checksum{64, 4}, extentSize{68, 4}, entrySize{72, 4}, totalCount{76, 8};
}  // namespace tbl

namespace map {
inline constexpr Field head1Checksum{64, 4}, attribute{68, 4}, logicBlockSize{72, 4}, totalCount{76, 8},
    parentTotalCount{100, 8}, var0Checksum{4096, 4}, mappedCount{4100, 8}, var1Checksum{4160, 4}, seg0Checksum{4164, 4},
    seg0PoolCount{4168, 4}, promoteTime{4188, 4}, var2Checksum{4224, 4}, syncCount{4228, 8}, childAttribute{4236, 4};
inline constexpr UUIDField parentUUID{84}, sessionUUID{4172}, trackUUID{4240}, previousTrackUUID{4256},
    currentTrackUUID{4272};
constexpr UUIDField poolUUID(unsigned int index) { return {8192 + std::uint64_t{16} * index}; }
}  // namespace map

namespace dat {
inline constexpr Field head1Checksum{64, 4}, serialNumber{68, 4};
}  // namespace dat

namespace fri {
inline constexpr Field head1Checksum{64, 4}, entrySize{68, 4}, totalGroupCount{72, 8}, var0Checksum{4096, 4},
    totalFreeCount{4100, 8}, indexHead{4108, 8};
}  // namespace fri

namespace jnl {
inline constexpr Field head1Checksum{64, 4}, totalCount{68, 8}, var0Checksum{4096, 4}, shutdownTag{4100, 4},
    syncCount{4104, 4}, var1Checksum{4160, 4}, lastTransID{4164, 4}, lastRecordStart{4168, 8}, lastFlushErrno{4176, 4},
    lastRecoveryError{4180, 4}, emptyRecordStart{4184, 8};
}  // namespace jnl

/// The header block's size, and where the payload of the files made here starts.
inline constexpr std::uint64_t headerBlockSize = 24576;

/// A map entry as stored.
struct MapEntry {
    std::uint64_t extentAddress = 0;
    unsigned int poolNumber = 0;
    bool mapped = false, vpushed = false, vpulled = false, synced = false;

    std::uint64_t stored() const;
};

/// A file in the making: pieces at positions, and a size. It is written sparse.
class EPFileBuilder {
public:
    /// A valid file of each kind, nothing after the header block. Every byte of every field has a value of its own (but
    /// for the type, the data start offset and the pool count), so that a field read too short or beside itself shows.
    static EPFileBuilder table();
    static EPFileBuilder map();
    static EPFileBuilder data();
    static EPFileBuilder freeIndex();
    static EPFileBuilder journal();

    EPFileBuilder& set(Field field, std::uint64_t value);

    /// A UUID whose bytes count up from `firstByte`.
    EPFileBuilder& set(UUIDField field, unsigned char firstByte);

    /// The map entry of `index`, counted from the header block's end.
    EPFileBuilder& entry(std::uint64_t index, std::uint64_t stored);

    /// Bytes at a position of the file.
    EPFileBuilder& bytes(std::uint64_t position, std::string_view content);

    /// Cuts or extends the file to `size` bytes.
    EPFileBuilder& resize(std::uint64_t size);

    /// Writes the file, with the folders above it. Throws std::system_error.
    void write(const std::string& path) const;

private:
    EPFileBuilder(unsigned int type, unsigned char uuidFirstByte);

    std::map<std::uint64_t, std::string> pieces_;
    std::uint64_t size_ = 0;
};

/// The `width` low bytes of `value`, least significant first.
std::string littleEndian(std::uint64_t value, unsigned int width);

}  // namespace epbuilder
