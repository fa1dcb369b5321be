// Rules for the configuration of a LUN against the files of the store.
#pragma once

#include <ISCSIEPFileMAP.h>

#include <string>
#include <vector>

#include "check/Report.h"
#include "store/Luns.h"
#include "store/Store.h"

namespace inspection {

/// A file that is expected at a path: nothing is there, or a link that leads nowhere.
struct MissingFile {
    std::string path;
    bool isLink;
    std::vector<const Lun*> luns;  ///< that should have it
};

/// `missing-map`: there is no file where the map file of these LUNs should be.
void checkMissingMap(const MissingFile& file, Report& report);

/// `missing-file`: there is no journal, table or free-index file for these LUNs, or a link to one leads nowhere.
void checkMissingFile(const MissingFile& file, Report& report);

/// `missing-data-file`: a link leads nowhere.
void checkMissingDataFile(const MissingFile& file, Report& report);

/// `same-map`: two LUNs have one map file.
void checkSameMap(const std::string& map, const std::vector<const Lun*>& luns, Report& report);

/// `lun-size`: the map's total count times the LUN's extent size against the LUN's size.
void checkLunSize(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFileMAP& content, const Lun& lun, Report& report);

/// `extent-size`: the one in the table file `table` against the LUN's.
void checkExtentSize(const std::string& table, std::uint32_t extentSize, const Lun& lun, Report& report);

}  // namespace inspection
