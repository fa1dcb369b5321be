// Decodings that may not mean what they seem to: said on standard error, without consequences.
#pragma once

#include <ISCSIEPFile.h>

#include <string>

#include "store/FileKind.h"

namespace epinspect {

/// Says what is doubtful about showing `file`, whose HEAD[0] is decoded and which the user called `name`: its name
/// tells another kind than its type does, and all that sayDataStartDoubts() says.
/// `byName` is the kind that was taken from the file's name, null when it was not.
void sayKindDoubts(const ISCSI::TOOL::ISCSIEPFile& file, const std::string& name, const FileKind* byName);

/// Says when the data start offset lies inside the header block or behind the end of the file.
void sayDataStartDoubts(const ISCSI::TOOL::ISCSIEPFile& file, const std::string& name);

/// Says when a map file ends inside an entry.
void sayPartialEntry(const ISCSI::TOOL::ISCSIEPFile& file, const std::string& name);

}  // namespace epinspect
