#include "check/Finding.h"

namespace inspection {

const char* nameOf(Rule rule) {
    switch (rule) {
        case Rule::kind:
            return "kind";
        case Rule::dataStart:
            return "data-start";
        case Rule::magic:
            return "magic";
        case Rule::version:
            return "version";
        case Rule::totalCount:
            return "total-count";
        case Rule::mappedCount:
            return "mapped-count";
        case Rule::syncCount:
            return "sync-count";
        case Rule::poolCount:
            return "pool-count";
        case Rule::partialEntry:
            return "partial-entry";
        case Rule::unmappedBits:
            return "unmapped-bits";
        case Rule::addressBits:
            return "address-bits";
        case Rule::missingDataFile:
            return "missing-data-file";
        case Rule::beyondDataFile:
            return "beyond-data-file";
        case Rule::sharedExtents:
            return "shared-extents";
        case Rule::serialNumber:
            return "serial-number";
        case Rule::lunSize:
            return "lun-size";
        case Rule::extentSize:
            return "extent-size";
        case Rule::missingMap:
            return "missing-map";
        case Rule::sameMap:
            return "same-map";
        case Rule::missingFile:
            return "missing-file";
    }
    return "";
}

}  // namespace inspection
