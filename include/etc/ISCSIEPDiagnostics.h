// What every public header needs: error codes and their names, and the mark of an exported class.
#pragma once

/// Marks a class as part of the shared library's interface.
#define ISCSI_EP_EXPORT __attribute__((visibility("default")))

namespace ISCSI::TOOL {

/// Error codes. 0 is success; any code not listed here comes unchanged from the platform's iSCSI library.
/// After a failed operation errno holds the system's reason, as the failing call left it; it is 0 where the system is
/// not to blame: the file ended, the type was wrong, an argument was bad.
inline constexpr int EP_ERR_BAD_ARGUMENT = 18990003;     ///< no input, too much to render, or a part outside the whole
inline constexpr int EP_ERR_OPEN_FAILED = 18990038;      ///< an EP file could not be opened
inline constexpr int EP_ERR_READ_FAILED = 18990039;      ///< reading an EP file failed or came short
inline constexpr int EP_ERR_SEEK_FAILED = 18990041;      ///< the file cannot be read at a computed position
inline constexpr int EP_ERR_BAD_UUID = 18990209;         ///< 16 bytes could not be rendered as UUID text
inline constexpr int EP_ERR_WRONG_FILE_TYPE = 18990400;  ///< HEAD[0] names another type than the operation needs
inline constexpr int EP_ERR_NO_PATH = 18990401;          ///< the path of an EP file could not be worked out
inline constexpr int EP_ERR_BAD_EXTENT_SIZE = 18990507;  ///< an extent size is zero, or more than memory holds

/// The name of one of these codes ("EP_ERR_OPEN_FAILED"); null for 0 and for any other code.
inline const char* GetErrorName(int error) {
    switch (error) {
        case EP_ERR_BAD_ARGUMENT:
            return "EP_ERR_BAD_ARGUMENT";
        case EP_ERR_OPEN_FAILED:
            return "EP_ERR_OPEN_FAILED";
        case EP_ERR_READ_FAILED:
            return "EP_ERR_READ_FAILED";
        case EP_ERR_SEEK_FAILED:
            return "EP_ERR_SEEK_FAILED";
        case EP_ERR_BAD_UUID:
            return "EP_ERR_BAD_UUID";
        case EP_ERR_WRONG_FILE_TYPE:
            return "EP_ERR_WRONG_FILE_TYPE";
        case EP_ERR_NO_PATH:
            return "EP_ERR_NO_PATH";
        case EP_ERR_BAD_EXTENT_SIZE:
            return "EP_ERR_BAD_EXTENT_SIZE";
        default:
            return nullptr;
    }
}

}  // namespace ISCSI::TOOL
