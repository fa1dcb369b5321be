// String tools: raw header bytes to text. They keep no state, throw nothing but what GetTimeInString says, and may run
// on several threads at once.
#pragma once

#include <time.h>  // NOLINT(modernize-deprecated-headers): localtime_r and tzset are POSIX, <ctime> need not have them

#include <algorithm>
#include <cstddef>
#include <cstdint>
#include <cstdio>
#include <exception>
#include <string>

#include "ISCSIEPDiagnostics.h"

namespace ISCSI::TOOL {

/// Writes the two hexadecimal digits of each of `count` bytes to `digits`. A plain loop in a function of its own is
/// what compilers turn into the best vector instructions: expanded into a loop over blocks, it is a quarter slower.
[[gnu::noinline]] inline void PutHexDigits(const unsigned char* bytes, std::size_t count, char* digits) {
    const auto digit = [](unsigned int value) {
        return static_cast<char>(value + '0' + (value > 9U ? 'a' - '9' - 1U : 0U));
    };
    for (std::size_t i = 0; i < count; ++i) {
        digits[2 * i] = digit(bytes[i] >> 4U);
        digits[2 * i + 1] = digit(bytes[i] & 0xFU);
    }
}

/// Replaces `text` by `length` bytes as lower-case hexadecimal digits, two a byte, high four bits first.
/// Returns 0, or EP_ERR_BAD_ARGUMENT when `data` is null (logged) or the text cannot be held in memory (not logged:
/// the caller knows what it was for); `text` then keeps its content.
inline int GetHexInString(const unsigned char* data, unsigned int length, std::string& text) {
    if (data == nullptr) {
        EP_LOG_ERR(190, "%s", "Input pointer is NULL.");
        return EP_ERR_BAD_ARGUMENT;
    }
    std::string digits;
    if (2ULL * length > digits.max_size()) return EP_ERR_BAD_ARGUMENT;
    try {
        digits.reserve(2 * std::size_t{length});
    } catch (const std::exception&) {
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
    if (bytes == nullptr) return EP_ERR_BAD_ARGUMENT;
    char buffer[37];
    const int length =
        std::snprintf(buffer, sizeof buffer, "%02x%02x%02x%02x-%02x%02x-%02x%02x-%02x%02x-%02x%02x%02x%02x%02x%02x",
                      bytes[0], bytes[1], bytes[2], bytes[3], bytes[4], bytes[5], bytes[6], bytes[7], bytes[8],
                      bytes[9], bytes[10], bytes[11], bytes[12], bytes[13], bytes[14], bytes[15]);
    bool rendered = length == 36;
    try {
        if (rendered) text.assign(buffer, 36);
    } catch (const std::exception&) {
        rendered = false;
    }
    if (!rendered) {
        EP_LOG_ERR(138, "Invalid UUID format: %.16s", reinterpret_cast<const char*>(bytes));
        return EP_ERR_BAD_UUID;
    }
    return 0;
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
