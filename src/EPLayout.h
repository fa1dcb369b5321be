// Where the sections of the header block start, in bytes from the start of the file. The offsets of the fields inside
// a section stand beside the class that decodes it.
#pragma once

#include "ISCSIEPFile.h"
#include "etc/ISCSIEPFormat.h"

namespace ISCSI::TOOL {

inline constexpr unsigned int EP_HEAD0 = 0;
inline constexpr unsigned int EP_HEAD1 = 64;
inline constexpr unsigned int EP_VAR0 = 4096;
inline constexpr unsigned int EP_VAR1 = 4160;
inline constexpr unsigned int EP_VAR2 = 4224;
inline constexpr unsigned int EP_SEG0 = 8192;

inline constexpr unsigned int EP_SECTION_SIZE = 64;  ///< of the HEAD and VAR sections
inline constexpr unsigned int EP_UUID_SIZE = 16;

static_assert(EP_HEAD0 + EP_SECTION_SIZE == EP_HEAD1 && EP_HEAD1 + EP_SECTION_SIZE <= EP_VAR0);
static_assert(EP_VAR0 + EP_SECTION_SIZE == EP_VAR1 && EP_VAR1 + EP_SECTION_SIZE == EP_VAR2);
static_assert(EP_VAR2 + EP_SECTION_SIZE <= EP_SEG0);
static_assert(EP_SEG0 + EP_POOL_COUNT_MAX * EP_UUID_SIZE == EP_HEADER_BLOCK_SIZE);

}  // namespace ISCSI::TOOL
