#include "map/MapRuns.h"

namespace epinspect {

using Entry = ISCSI::TOOL::ISCSIEPMapEntryInfo;

namespace {

bool sameFlags(const Entry& a, const Entry& b) {
    return a.mapped == b.mapped && a.vpushed == b.vpushed && a.vpulled == b.vpulled && a.synced == b.synced;
}

}  // namespace

bool isHole(const Entry& entry) {
    return entry.extentAddress == 0 && entry.poolNumber == 0 && sameFlags(entry, Entry());
}

bool MapRun::continuesWith(const Entry& next) const {
    if (isHole(entry) || isHole(next)) return isHole(entry) && isHole(next);
    return sameFlags(entry, next) && entry.poolNumber == next.poolNumber &&
           entry.extentAddress + count == next.extentAddress;
}

void MapSummary::add(const Entry& entry) {
    ++entries;
    mapped += entry.mapped ? 1U : 0U;
    synced += entry.synced ? 1U : 0U;
    holes += isHole(entry) ? 1U : 0U;
}

}  // namespace epinspect
