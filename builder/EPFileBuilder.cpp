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
    set(head0::checksum, 0x0a1b2c3d).set(head0::version, 2).set(head0::magicCode, 0x1122334455667788);
    set(head0::type, type).set(head0::uuid, uuidFirstByte).set(head0::dataStartOffset, headerBlockSize);
    set(head0::createTime, 1600000000);
}

EPFileBuilder EPFileBuilder::table() {
    EPFileBuilder file(1, 0x10);
    file.set(tbl::head1Checksum, 0xa1).set(tbl::extentSize, 1048576).set(tbl::entrySize, 16);
    return file.set(tbl::totalCount, 8388608);
}

EPFileBuilder EPFileBuilder::freeIndex() {
    EPFileBuilder file(2, 0x20);
    file.set(fri::head1Checksum, 0xb1).set(fri::entrySize, 8).set(fri::totalGroupCount, 0x100);
    return file.set(fri::var0Checksum, 0xb2).set(fri::totalFreeCount, 0x100000001).set(fri::indexHead, 77);
}

EPFileBuilder EPFileBuilder::data() {
    EPFileBuilder file(3, 0x30);
    return file.set(dat::head1Checksum, 0xc1).set(dat::serialNumber, 5);
}

EPFileBuilder EPFileBuilder::map() {
    EPFileBuilder file(4, 0x40);
    file.set(map::head1Checksum, 0xd1).set(map::attribute, 0x3f).set(map::logicBlockSize, 512);
    file.set(map::totalCount, 4096).set(map::parentUUID, 0x50).set(map::parentTotalCount, 2048);
    file.set(map::var0Checksum, 0xd2).set(map::mappedCount, 3000);
    file.set(map::var1Checksum, 0xd3).set(map::seg0Checksum, 0xd4).set(map::seg0PoolCount, 2);
    file.set(map::sessionUUID, 0x60).set(map::promoteTime, 1600000060);
    file.set(map::var2Checksum, 0xd5).set(map::syncCount, 1000).set(map::childAttribute, 0x1c);
    file.set(map::trackUUID, 0x70).set(map::previousTrackUUID, 0x80).set(map::currentTrackUUID, 0x90);
    return file.set(map::poolUUID(0), 0xa0).set(map::poolUUID(1), 0xb0);
}

EPFileBuilder EPFileBuilder::journal() {
    EPFileBuilder file(5, 0xc0);
    file.set(jnl::head1Checksum, 0xe1).set(jnl::totalCount, 65536);
    file.set(jnl::var0Checksum, 0xe2).set(jnl::shutdownTag, 0x5afe).set(jnl::syncCount, 12);
    file.set(jnl::var1Checksum, 0xe3).set(jnl::lastTransID, 4711).set(jnl::lastRecordStart, 0x100000000);
    file.set(jnl::lastFlushErrno, 0xfffffffb).set(jnl::lastRecoveryError, 0);
    return file.set(jnl::emptyRecordStart, 8192);
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
