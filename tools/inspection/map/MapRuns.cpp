#include "map/MapRuns.h"

namespace inspection {

void MapSummary::add(const MapRun& run) {
    const bool hole = isHole(run.entry);
    const auto where = [&run](bool condition) { return condition ? run.count : 0; };
    entries += run.count;
    mapped += where(run.entry.mapped);
    unmapped += where(!run.entry.mapped && !hole);
    vpushed += where(run.entry.vpushed);
    vpulled += where(run.entry.vpulled);
    synced += where(run.entry.synced);
    holes += where(hole);
    ++runs;
}

}  // namespace inspection
