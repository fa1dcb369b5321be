#include "EPFileBuilder.h"

#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <fstream>
#include <system_error>

namespace epbuilder {

std::string littleEndian(std::uint64_t value, unsigned int width) {
    std::string bytes;
    for (unsigned int i = 0; i < width; ++i) bytes.push_back(static_cast<char>((value >> (8 * i)) & 0xFFU));
    return bytes;
}

std::uint64_t MapEntry::stored() const {
    const auto bit = [](bool flag, unsigned int number) { return std::uint64_t{flag ? 1U : 0U} << number; };
    return bit(mapped, 63) | bit(vpushed, 62) | bit(vpulled, 61) | bit(synced, 60) | std::uint64_t{poolNumber} << 48U |
           extentAddress;
}

EPFileBuilder::EPFileBuilder(unsigned int type, unsigned char uuidFirstByte) {
    bytes(0, std::string(headerBlockSize, '\0'));
    set(head0::checksum, 0x0a1b2c3d).set(head0::version, 0x02030405).set(head0::magicCode, 0x1122334455667788);
    set(head0::type, type).set(head0::uuid, uuidFirstByte).set(head0::dataStartOffset, headerBlockSize);
    set(head0::createTime, 1600000000);
}

EPFileBuilder EPFileBuilder::table() {
    EPFileBuilder file(1, 0x10);
    file.set(tbl::head1Checksum, 0xa1a2a3a4).set(tbl::extentSize, 0xa5a6a7a8).set(tbl::entrySize, 0xa9aaabac);
    return file.set(tbl::totalCount, 0xadaeafb0b1b2b3b4);
}

EPFileBuilder EPFileBuilder::freeIndex() {
    EPFileBuilder file(2, 0x20);
    file.set(fri::head1Checksum, 0xb1b2b3b4).set(fri::entrySize, 0xb5b6b7b8);
    file.set(fri::totalGroupCount, 0xb9babbbcbdbebfc0).set(fri::var0Checksum, 0xc1c2c3c4);
    return file.set(fri::totalFreeCount, 0xc5c6c7c8c9cacbcc).set(fri::indexHead, 0xcdcecfd0d1d2d3d4);
}

EPFileBuilder EPFileBuilder::data() {
    EPFileBuilder file(3, 0x30);
    return file.set(dat::head1Checksum, 0xc1c2c3c4).set(dat::serialNumber, 0xc5c6c7c8);
}

EPFileBuilder EPFileBuilder::map() {
    EPFileBuilder file(4, 0x40);
    file.set(map::head1Checksum, 0xd1d2d3d4).set(map::attribute, 0xd5d6d7d8).set(map::logicBlockSize, 0xd9dadbdc);
    file.set(map::totalCount, 0xdddedfe0e1e2e3e4).set(map::parentUUID, 0x50);
    file.set(map::parentTotalCount, 0xe5e6e7e8e9eaebec).set(map::var0Checksum, 0x01122334);
    file.set(map::mappedCount, 0x1213141516171819).set(map::var1Checksum, 0x21222324);
    file.set(map::seg0Checksum, 0x25262728).set(map::seg0PoolCount, 2).set(map::sessionUUID, 0x60);
    file.set(map::promoteTime, 1600000060).set(map::var2Checksum, 0x31323334).set(map::syncCount, 0x35363738393a3b3c);
    file.set(map::childAttribute, 0x3d3e3f40).set(map::trackUUID, 0x70).set(map::previousTrackUUID, 0x80);
    return file.set(map::currentTrackUUID, 0x90).set(map::poolUUID(0), 0xa0).set(map::poolUUID(1), 0xb0);
}

EPFileBuilder EPFileBuilder::journal() {
    EPFileBuilder file(5, 0xc0);
    file.set(jnl::head1Checksum, 0xe1e2e3e4).set(jnl::totalCount, 0xe5e6e7e8e9eaebec);
    file.set(jnl::var0Checksum, 0xf1f2f3f4).set(jnl::shutdownTag, 0xf5f6f7f8).set(jnl::syncCount, 0xf9fafbfc);
    file.set(jnl::var1Checksum, 0x41424344).set(jnl::lastTransID, 0x45464748);
    file.set(jnl::lastRecordStart, 0x494a4b4c4d4e4f50).set(jnl::lastFlushErrno, 0xfbfcfdfe);
    return file.set(jnl::lastRecoveryError, 0x51525354).set(jnl::emptyRecordStart, 0x55565758595a5b5c);
}

EPFileBuilder& EPFileBuilder::set(Field field, std::uint64_t value) {
    return bytes(field.offset, littleEndian(value, field.width));
}

EPFileBuilder& EPFileBuilder::set(UUIDField field, unsigned char firstByte) {
    std::string uuid;
    for (unsigned int i = 0; i < 16; ++i) uuid.push_back(static_cast<char>(firstByte + i));
    return bytes(field.offset, uuid);
}

EPFileBuilder& EPFileBuilder::entry(std::uint64_t index, std::uint64_t stored) {
    return bytes(headerBlockSize + 8 * index, littleEndian(stored, 8));
}

EPFileBuilder& EPFileBuilder::bytes(std::uint64_t position, std::string_view content) {
    auto& header = pieces_[0];
    if (position + content.size() <= header.size()) {
        header.replace(static_cast<std::size_t>(position), content.size(), content);
    } else {
        pieces_[position] = content;
        size_ = std::max(size_, position + content.size());
    }
    return *this;
}

EPFileBuilder& EPFileBuilder::resize(std::uint64_t size) {
    size_ = size;
    return *this;
}

void EPFileBuilder::write(const std::string& path) const {
    const std::filesystem::path folder = std::filesystem::path(path).parent_path();
    if (!folder.empty()) std::filesystem::create_directories(folder);
    std::ofstream file(path, std::ios::binary | std::ios::trunc);
    for (const auto& [position, content] : pieces_) {
        file.seekp(static_cast<std::streamoff>(position));
        file.write(content.data(), static_cast<std::streamsize>(content.size()));
    }
    file.close();
    if (!file || ::truncate(path.c_str(), static_cast<off_t>(size_)) != 0) {
        throw std::system_error(errno, std::generic_category(), path);
    }
}

}  // namespace epbuilder
