// The log line of every failure, one per failing step: "iSCSI:FILE:LINE:OPERATION MESSAGE" at priority LOG_ERR.
#pragma once

#include <cerrno>

namespace ISCSI::TOOL {

/// The system's syslog(), under its plain name. In a hardened build <syslog.h> would call another function, and a
/// caller that defines a syslog() of its own would not be called.
[[gnu::format(printf, 2, 3)]] void SystemLog(int priority, const char* format, ...) __asm__("syslog");

inline constexpr int SYSTEM_LOG_ERR = 3;

/// Puts errno back when it goes out of scope: the log call must not disturb the reason of the failure.
struct ErrnoKeeper {
    ErrnoKeeper() = default;
    ErrnoKeeper(const ErrnoKeeper&) = delete;
    ErrnoKeeper& operator=(const ErrnoKeeper&) = delete;
    ~ErrnoKeeper() { errno = kept; }
    const int kept = errno;
};

/// The last part of `path`.
constexpr const char* FileNameOf(const char* path) {
    const char* name = path;
    for (; *path != '\0'; ++path) {
        if (*path == '/') name = path + 1;
    }
    return name;
}

}  // namespace ISCSI::TOOL

/// The name of the source file it stands in, without folder; old compilers have no macro of their own for that.
#ifdef __FILE_NAME__
#define EP_LOG_FILE __FILE_NAME__
#else
#define EP_LOG_FILE ::ISCSI::TOOL::FileNameOf(__FILE__)
#endif

/// Writes the line of `operation` in `sourceFile`. `line` is a fixed number that identifies the failure and never
/// follows the source text. After it come the format, which is a literal, and its arguments.
#define EP_LOG_ERR_FOR(sourceFile, operation, line, format, ...)                                                       \
    do {                                                                                                               \
        const ::ISCSI::TOOL::ErrnoKeeper errnoBeforeLog;                                                               \
        ::ISCSI::TOOL::SystemLog(::ISCSI::TOOL::SYSTEM_LOG_ERR, "iSCSI:%s:%d:%s " format, sourceFile, line, operation, \
                                 __VA_ARGS__);                                                                         \
    } while (false)

/// The same on behalf of the operation it stands in.
#define EP_LOG_ERR(line, format, ...) EP_LOG_ERR_FOR(EP_LOG_FILE, __func__, line, format, __VA_ARGS__)
