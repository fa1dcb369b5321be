// What lies in a folder of the target.
#pragma once

#include <optional>
#include <string>
#include <vector>

#include "store/Context.h"

namespace inspection {

struct Listing {
    std::vector<std::string> names;  ///< in no order
    std::optional<Failure> failure;  ///< why there may be more; it names the folder that is closed
};

/// The names in the folder at `hostPath`; a failure calls it `name`.
Listing listHere(const std::string& hostPath, const std::string& name);

/// The names in the folder at `path` of the target, none where no such folder is there. A link that leads nowhere is a
/// failure.
Listing listFolder(const Context& context, const std::string& path);

/// The failure to look at what lies at `path` of the target; where a folder on the way may not be looked into, it is
/// about that folder.
Failure failureOf(const Located& located, const std::string& path);

}  // namespace inspection
