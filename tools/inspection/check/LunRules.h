// Rules for the configuration of a LUN against the files of the store.
#pragma once

#include <ISCSIEPFileMAP.h>

#include <string>

#include "check/Report.h"
#include "store/Luns.h"
#include "store/Store.h"

namespace inspection {

/// `missing-map`: there is no file where the LUN's map file should be.
void tellMissingMap(const StoreFile& file, const Lun& lun, Report& report);

/// `lun-size`: the map's total count times the LUN's extent size against the LUN's size.
void checkLunSize(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFileMAP& content, const Lun& lun, Report& report);

/// `extent-size`: the one in the table file `table` against the LUN's.
void checkExtentSize(const std::string& table, std::uint32_t extentSize, const Lun& lun, Report& report);

}  // namespace inspection
