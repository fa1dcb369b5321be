// String tools: raw header bytes to text. They keep no state and may run on several threads at once. Only
// GetTimeInString() throws.
#pragma once

#include <time.h>  // NOLINT(modernize-deprecated-headers): localtime_r and tzset are POSIX, <ctime> need not have them

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <cstring>
#include <exception>
#include <new>
#include <string>
#include <utility>

#include "ISCSIEPDiagnostics.h"
#include "ISCSIEPLog.h"

namespace ISCSI::TOOL {

/// The two lower-case hexadecimal digits of every byte.
inline constexpr auto HexDigitPairs = [] {
    std::array<char, 512> pairs = {};
    for (std::size_t i = 0; i < pairs.size(); ++i) {
        pairs[i] = "0123456789abcdef"[i % 2 == 0 ? i / 32 : i / 2 % 16];  // high four bits first
    }
    return pairs;
}();

/// PutHexDigits() a block at a time, in vectors of as many bytes as there are `Places`. Returns how many of the `count`
/// bytes are done: all whole blocks, or none where machine or compiler have no such vectors.
template <std::size_t... Places>
[[gnu::always_inline]] inline std::size_t PutHexBlocks([[maybe_unused]] const unsigned char* bytes,
                                                       [[maybe_unused]] std::size_t count,
                                                       [[maybe_unused]] char* digits,
                                                       std::index_sequence<Places...> /*places*/) {
    std::size_t done = 0;
#if defined(__SSE2__) && defined(__has_builtin)
#if __has_builtin(__builtin_shufflevector)
    constexpr std::size_t size = sizeof...(Places);
    // NOLINTBEGIN(modernize-use-using): of a type alias g++ forgets the size
    typedef signed char Bytes __attribute__((vector_size(size)));
    typedef unsigned short Words __attribute__((vector_size(size)));
    // NOLINTEND(modernize-use-using)
    for (; done + size <= count; done += size) {
        Bytes block;
        std::memcpy(&block, bytes + done, size);
        Bytes high = (Bytes(Words(block) >> 4) & 0xF) | '0';
        Bytes low = (block & 0xF) | '0';
        high += Bytes(high > '9') & ('a' - '9' - 1);
        low += Bytes(low > '9') & ('a' - '9' - 1);
        const Bytes first = __builtin_shufflevector(high, low, (Places / 2 + Places % 2 * size)...);
        const Bytes second = __builtin_shufflevector(high, low, ((size + Places) / 2 + Places % 2 * size)...);
        std::memcpy(digits + 2 * done, &first, size);
        std::memcpy(digits + 2 * done + size, &second, size);
    }
#endif
#endif
    return done;
}

/// Writes the two hexadecimal digits of each of `count` bytes to `digits`. `bytes` may be the second half of the memory
/// at `digits`, which is then written over.
inline void PutHexDigits(const unsigned char* bytes, std::size_t count, char* digits) {
    for (auto i = PutHexBlocks(bytes, count, digits, std::make_index_sequence<16>()); i < count; ++i) {
        std::memcpy(digits + 2 * i, &HexDigitPairs[2 * std::size_t{bytes[i]}], 2);
    }
}

/// Replaces `text` by `length` bytes as lower-case hexadecimal digits, two per byte, high four bits first.
/// Returns 0, or EP_ERR_BAD_ARGUMENT when `data` is null (logged) or the text cannot be held in memory (not logged:
/// the caller knows what it was for); `text` then keeps its content.
inline int GetHexInString(const unsigned char* data, unsigned int length, std::string& text) {
    if (data == nullptr) {
        errno = 0;
        const ErrnoKeeper keeper;
        SystemLog(SYSTEM_LOG_ERR, "iSCSI:%s:%d:%s Input pointer is NULL.", EP_LOG_FILE, 190, __func__);
        return EP_ERR_BAD_ARGUMENT;
    }
    std::string digits;
    try {
        if (2ULL * length > digits.max_size()) throw std::bad_alloc();
        digits.reserve(2 * std::size_t{length});
    } catch (const std::exception&) {
        errno = ENOMEM;
        return EP_ERR_BAD_ARGUMENT;
    }
    // In blocks that stay in the nearest cache between being added to the text and being written.
    constexpr std::size_t blockSize = 512;
    for (std::size_t done = 0; done < length; done += blockSize) {
        const std::size_t count = std::min<std::size_t>(length - done, blockSize);
        digits.append(2 * count, '0');
        PutHexDigits(data + done, count, &digits[2 * done]);
    }
    text.swap(digits);
    return 0;
}

/// Replaces `text` by 16 bytes, in stored order, as the 36 characters of a UUID ("00010203-0405-...").
/// Returns 0, EP_ERR_BAD_ARGUMENT when `bytes` is null (not logged), or EP_ERR_BAD_UUID (logged) when the text cannot
/// be made; `text` then keeps its content.
inline int GetUUIDInString(const unsigned char* bytes, std::string& text) {
    errno = 0;
    if (bytes == nullptr) return EP_ERR_BAD_ARGUMENT;
    char buffer[37];
    const int length =
        std::snprintf(buffer, sizeof buffer, "%02x%02x%02x%02x-%02x%02x-%02x%02x-%02x%02x-%02x%02x%02x%02x%02x%02x",
                      bytes[0], bytes[1], bytes[2], bytes[3], bytes[4], bytes[5], bytes[6], bytes[7], bytes[8],
                      bytes[9], bytes[10], bytes[11], bytes[12], bytes[13], bytes[14], bytes[15]);
    try {
        if (length == 36) {
            text.assign(buffer, 36);
            return 0;
        }
    } catch (const std::exception&) {
        errno = ENOMEM;
    }
    char shown[17] = {};
    std::memcpy(shown, bytes, 16);
    EP_LOG_ERR(138, "Invalid UUID format: %s", shown);
    return EP_ERR_BAD_UUID;
}

/// The local time, in the process's time zone, of a count of seconds since 1970-01-01 00:00:00 UTC that is taken as
/// signed 32-bit: "Thu Jan 01 00:00:00 UTC 1970". Empty when it would exceed 31 characters, which takes an unusually
/// long time zone name. Throws nothing but std::bad_alloc.
inline std::string GetTimeInString(unsigned int seconds) {
    const auto instant = static_cast<time_t>(static_cast<std::int32_t>(seconds));
    struct tm local = {};
    tzset();
    localtime_r(&instant, &local);
    char buffer[32] = {};
    return {buffer, strftime(buffer, sizeof buffer, "%a %b %d %H:%M:%S %Z %Y", &local)};
}

}  // namespace ISCSI::TOOL
