// Rules for a data file.
#pragma once

#include <ISCSIEPFileDAT.h>

#include "check/Report.h"
#include "store/Store.h"

namespace inspection {

/// `serial-number`: against the number in the file's name.
void checkSerialNumber(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFileDAT& content, Report& report);

}  // namespace inspection
