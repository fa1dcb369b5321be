// The decoded fields of a header block, one after the other, by the names of the library's members.
#pragma once

#include <ISCSIEPFile.h>

#include <cstdint>
#include <string>
#include <vector>

namespace inspection {

struct HeaderField {
    enum class Form {
        number,
        hexadecimal,  ///< a number that the text dump shows in hexadecimal
        time,         ///< a number of seconds since 1970-01-01 00:00:00 UTC
        text,
        texts
    };

    const char* name;  ///< of the member
    Form form;
    std::uint64_t number = 0;
    std::vector<std::string> texts = {};  ///< of a text the only one
};

inline bool operator==(const HeaderField& one, const HeaderField& other) {
    return one.number == other.number && one.texts == other.texts;
}

/// The fields of HEAD[0], then those of the class that `file` is of.
std::vector<HeaderField> headerFieldsOf(const ISCSI::TOOL::ISCSIEPFile& file);

}  // namespace inspection
