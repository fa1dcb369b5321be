// How every part of the library reports a failure: an error code to the caller, one line to the system log.
#pragma once

#include <syslog.h>

/// Marks a class as part of the shared library's interface.
#define ISCSI_EP_EXPORT __attribute__((visibility("default")))

/// Writes one line to the system log at priority LOG_ERR: "iSCSI:FILE:LINE:OPERATION MESSAGE". `line` is a fixed
/// number that identifies the failure and never follows the source text; the format and its arguments come after it.
#define EP_LOG_ERR(line, format, ...) \
    ::syslog(LOG_ERR, "iSCSI:%s:%d:%s " format, ::ISCSI::TOOL::GetSourceFileName(__FILE__), line, __func__, __VA_ARGS__)

namespace ISCSI::TOOL {

/// Error codes. 0 is success; any code not listed here comes unchanged from the platform's iSCSI library.
inline constexpr int EP_ERR_BAD_ARGUMENT = 18990003;     ///< a string tool got no input, or too much to render
inline constexpr int EP_ERR_OPEN_FAILED = 18990038;      ///< an EP file could not be opened
inline constexpr int EP_ERR_READ_FAILED = 18990039;      ///< reading an EP file failed or came short
inline constexpr int EP_ERR_SEEK_FAILED = 18990041;      ///< a computed position is not one the file can be read at
inline constexpr int EP_ERR_BAD_UUID = 18990209;         ///< 16 bytes could not be rendered as UUID text
inline constexpr int EP_ERR_WRONG_FILE_TYPE = 18990400;  ///< HEAD[0] names another type than the operation needs
inline constexpr int EP_ERR_NO_PATH = 18990401;          ///< the path of an EP file could not be worked out
inline constexpr int EP_ERR_BAD_EXTENT_SIZE = 18990507;  ///< an extent size is zero, or more than memory holds

/// The last component of a source file's path, as the log lines show it.
constexpr const char* GetSourceFileName(const char* path) {
    const char* name = path;
    for (const char* c = path; *c != '\0'; ++c) {
        if (*c == '/') name = c + 1;
    }
    return name;
}

}  // namespace ISCSI::TOOL
