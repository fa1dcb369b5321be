#include "ISCSIEPFileDAT.h"

#include <algorithm>
#include <exception>
#include <new>
#include <utility>

#include "DumpText.h"
#include "EPLayout.h"
#include "EPLookup.h"
#include "LittleEndian.h"
#include "etc/ISCSIEPLog.h"
#include "etc/ISCSIQuorinStringTool.h"

namespace ISCSI::TOOL {

namespace {

constexpr EPLookupIdentity extentLookup = EPLookupIdentity(EP_LOG_FILE, "getExtentData", EP_FILE_TYPE_DAT)
                                              .parseFailsAt(69)
                                              .typeFailsAt(73)
                                              .openFailsAt(77)
                                              .seekFailsAt(82)
                                              .readFailsAt(87);
constexpr EPLookupIdentity bytesLookup = EPLookupIdentity(EP_LOG_FILE, "getExtentBytes", EP_FILE_TYPE_DAT)
                                             .parseFailsAt(102)
                                             .typeFailsAt(103)
                                             .openFailsAt(104)
                                             .seekFailsAt(105)
                                             .readFailsAt(106);

/// Logs an extent size that cannot be used and returns its code.
int unusableExtentSize(const ISCSIEPFile& file, const EPLookupIdentity& lookup, int line, unsigned int extentSize) {
    EP_LOG_ERR_FOR(lookup.sourceFile, lookup.operation, line, "Invaild LUN extent size: %d. path: %s",
                   static_cast<int>(extentSize), file.path.c_str());
    return EP_ERR_BAD_EXTENT_SIZE;
}

#ifdef __SSE2__
/// PutHexDigits() in vectors twice as wide, for machines with AVX2.
__attribute__((target("avx2"))) void putDigitsWide(const unsigned char* bytes, std::size_t count, char* digits) {
    const std::size_t done = PutHexBlocks(bytes, count, digits, std::make_index_sequence<32>());
    PutHexDigits(bytes + done, count - done, digits + 2 * done);
}
#endif

void putDigits(const unsigned char* bytes, std::size_t count, char* digits) {
#ifdef __SSE2__
    if (__builtin_cpu_supports("avx2") != 0) return putDigitsWide(bytes, count, digits);
#endif
    PutHexDigits(bytes, count, digits);
}

/// Reads `size` bytes from `stream` and makes their hexadecimal digits the content of `text`, which is empty. False
/// when the read fails. Throws when memory cannot hold the digits.
bool readDigits(EPFileStream& stream, std::size_t size, std::string& text) {
#ifdef __cpp_lib_string_resize_and_overwrite
    // This is why g++ compiles this source as C++23: the string's memory is not filled before the digits are written,
    // and one read brings all bytes, into its second half. The other way takes half as long again.
    text.resize_and_overwrite(2 * size, [&stream, size](char* digits, std::size_t /*room*/) -> std::size_t {
        auto* bytes = reinterpret_cast<unsigned char*>(digits + size);
        if (!stream.read(bytes, size)) return 0;
        putDigits(bytes, size, digits);
        return 2 * size;
    });
    return !text.empty();
#else
    text.reserve(2 * size);
    unsigned char block[EP_HEADER_BLOCK_SIZE];
    for (std::size_t done = 0; done < size;) {
        const std::size_t count = std::min(size - done, sizeof block);
        if (!stream.read(block, count)) return false;
        text.append(2 * count, '0');
        putDigits(block, count, &text[2 * done]);
        done += count;
    }
    return true;
#endif
}

}  // namespace

ISCSIEPFileDAT::ISCSIEPFileDAT() : ISCSIEPFileDAT(std::string()) {}

ISCSIEPFileDAT::ISCSIEPFileDAT(const std::string& filePath) : ISCSIEPFile(filePath) {}

ISCSIEPFileDAT::~ISCSIEPFileDAT() = default;

int ISCSIEPFileDAT::parseFile() {
    const int error = parseHead0();
    if (error != 0) {
        EP_LOG_ERR(38, "Failed to get parse HEAD[0]. path: %s", path.c_str());
        return error;
    }
    const unsigned char* head1 = headerBlock + EP_HEAD1;
    head1Checksum = le32(head1);
    serialNumber = le32(head1 + 4);
    return 0;
}

int ISCSIEPFileDAT::getExtentData(unsigned long long index, unsigned int extentSize, std::string& data) {
    constexpr int extentSizeLine = 65;
    if (extentSize == 0) {
        errno = 0;
        return unusableExtentSize(*this, extentLookup, extentSizeLine, extentSize);
    }
    EPFileStream stream;
    const int error = seekToItem(*this, stream, extentLookup, index * extentSize);
    if (error != 0) return error;
    std::string text;
    try {
        if (2ULL * extentSize > text.max_size()) throw std::bad_alloc();
        if (!readDigits(stream, extentSize, text)) return readFailed(*this, extentLookup);
    } catch (const std::exception&) {
        errno = ENOMEM;
        return unusableExtentSize(*this, extentLookup, extentSizeLine, extentSize);
    }
    data.swap(text);
    return 0;
}

int ISCSIEPFileDAT::getExtentBytes(unsigned long long index, unsigned int extentSize, unsigned int offset,
                                   unsigned int length, unsigned char* bytes) {
    errno = 0;
    if (extentSize == 0) return unusableExtentSize(*this, bytesLookup, 101, extentSize);
    if (offset > extentSize || length > extentSize - offset || (bytes == nullptr && length > 0)) {
        EP_LOG_ERR(107, "Invalid part of an extent: %u bytes from %u. path: %s", length, offset, path.c_str());
        return EP_ERR_BAD_ARGUMENT;
    }
    EPFileStream stream;
    const int error = seekToItem(*this, stream, bytesLookup, index * extentSize + offset);
    if (error != 0) return error;
    return stream.read(bytes, length) ? 0 : readFailed(*this, bytesLookup);
}

std::string ISCSIEPFileDAT::toString() const {
    return DumpText(ISCSIEPFile::toString())
        .section("HEAD[1]")
        .hex("checksum", head1Checksum)
        .dec("serial number", serialNumber)
        .str();
}

}  // namespace ISCSI::TOOL
