#include "map/MapDiff.h"

namespace inspection {

void DiffSummary::add(const DiffRun& run) {
    const auto where = [&run](Difference difference) { return run.difference == difference ? run.count : 0; };
    onlyFirst += where(Difference::onlyFirst);
    onlySecond += where(Difference::onlySecond);
    moved += where(Difference::moved);
    flags += where(Difference::flags);
}

}  // namespace inspection
