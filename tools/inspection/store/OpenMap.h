// A map file that is about to be walked.
#pragma once

#include <ISCSIEPFileMAP.h>

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

#include "store/ChangeWatch.h"

namespace inspection {

struct OpenedMap {
    std::unique_ptr<ISCSI::TOOL::ISCSIEPFileMAP> file;  ///< HEAD[0] is decoded; null after a failure
    std::uint64_t entries = 0;                          ///< how many the file holds
    std::optional<ChangeWatch> watch;                   ///< from before it was opened; to be asked after the walk
};

/// Opens the map file that messages call `name` and remarks on what is doubtful about it. Reports failures.
OpenedMap openMap(Context& context, const std::string& name, NamedBy by);

}  // namespace inspection
