// The configuration of LUNs, as the platform's library gives it.
#pragma once

#include <ISCSILUNConfInfo.h>

#include <functional>
#include <string>

#include "Range.h"
#include "store/Context.h"

namespace inspection {

/// The ids that are tried unless the user names others.
constexpr Range usualLids = {0, 255};

/// A LUN, and where its map file lies on the target.
struct Lun {
    ISCSI::TOOL::ISCSILUNConfInfo record;
    std::string mapPath;
};

/// Loads the LUN `lid`. Returns 0 or the code of the platform's library.
int loadLun(Context& context, std::uint32_t lid, Lun& lun);

/// How messages name LUNs.
Subject subjectOf(Range lids);

/// Calls each() for the LUNs whose ids are in `range`, lowest id first. Ids that no LUN has are skipped, of other
/// failures the first one of each kind is reported. Returns whether there was a LUN.
bool forEachLun(Context& context, Range range, const std::function<void(const Lun&)>& each);

}  // namespace inspection
