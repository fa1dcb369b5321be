#include "Failure.h"

#include <ISCSILUNConfInfo.h>

#include <system_error>

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

std::string systemText(int reason) { return std::generic_category().message(reason); }

/// What a code of the library stands for.
const char* meaningOf(int error) {
    switch (error) {
        case tool::EP_ERR_BAD_ARGUMENT:
            return "no input";
        case tool::EP_ERR_OPEN_FAILED:
            return "cannot be opened";
        case tool::EP_ERR_READ_FAILED:
            return "cannot be read";
        case tool::EP_ERR_SEEK_FAILED:
            return "position out of any file's range";
        case tool::EP_ERR_BAD_UUID:
            return "UUID cannot be shown";
        case tool::EP_ERR_WRONG_FILE_TYPE:
            return "wrong type of EP file";
        case tool::EP_ERR_NO_PATH:
            return "path names no volume";
        default:
            return "extent size cannot be used";
    }
}

std::string whatFailed(const Failure& failure) {
    const std::string why = failure.reason != 0 ? ": " + systemText(failure.reason) : "";
    if (!failure.what.empty()) return failure.what + why;
    if (tool::GetErrorName(failure.error) == nullptr) {
        const std::string text = tool::ISCSILUNConfInfo::getErrorText(failure.error);
        return "configuration cannot be loaded" + (text.empty() ? text : ": " + text) + why;
    }
    if (failure.reason != 0) return meaningOf(failure.error) + why;
    return failure.error == tool::EP_ERR_READ_FAILED ? "ends too early" : meaningOf(failure.error);
}

}  // namespace

std::string textOf(const Subject& subject) {
    if (subject.file.empty() && subject.part.empty()) return "''";
    return subject.file + (subject.file.empty() || subject.part.empty() ? "" : ": ") + subject.part;
}

std::string whatOf(const Failure& failure) {
    std::string what = whatFailed(failure);
    if (failure.error == 0) return what;
    const char* name = tool::GetErrorName(failure.error);
    return what + " (" + (name != nullptr ? name + std::string(", ") : "code ") + std::to_string(failure.error) + ")";
}

std::string messageOf(const Failure& failure) { return textOf(failure.subject) + ": " + whatOf(failure); }

Failure pastEnd(const std::string& file, const std::string& place, unsigned long long count) {
    std::string what = "past the end, the file holds ";
    if (count == 0) {
        what += "none";
    } else {
        what += count == 1 ? "0" : "0-" + std::to_string(count - 1);
    }
    return {{file, place}, tool::EP_ERR_READ_FAILED, 0, what};
}

}  // namespace inspection
