// Where the sections of the header block start, in bytes from the start of the file. The offsets of the fields inside
// a section stand beside the class that decodes it.
#pragma once

namespace ISCSI::TOOL {

inline constexpr unsigned int EP_HEAD0 = 0;
inline constexpr unsigned int EP_HEAD1 = 64;
inline constexpr unsigned int EP_VAR0 = 4096;
inline constexpr unsigned int EP_VAR1 = 4160;
inline constexpr unsigned int EP_VAR2 = 4224;
inline constexpr unsigned int EP_SEG0 = 8192;

inline constexpr unsigned int EP_UUID_SIZE = 16;
inline constexpr unsigned int EP_MAP_ENTRY_SIZE = 8;

}  // namespace ISCSI::TOOL
