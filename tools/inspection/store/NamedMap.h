// A map as the user named it: by the id of its LUN, or by its path.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

#include "Typed.h"
#include "store/Luns.h"

namespace inspection {

/// The name as it was typed: a LUN id, or the path of a map file.
struct LunName {
    std::optional<std::uint32_t> lid;
    std::string file;
};

/// What is typed as such: a LUN id is decimal digits alone.
Typed<LunName> lunNameIn(const std::string& text);

struct NamedMap {
    std::string file;        ///< as typed; of a LUN named by its id the path on the target
    NamedBy by;              ///< which of the two `file` is
    std::string targetPath;  ///< on the target, in plain form
    std::vector<Lun> luns;   ///< whose map it is: the LUN named by its id, or all that are known, lowest id first
    std::vector<Failure> failures;  ///< of LUNs that may have this map too; not reported yet

    std::vector<std::uint32_t> lids() const;
};

/// Finds out which map is meant. Nothing, and a failure, when the LUN of that id cannot be loaded. For a path below the
/// target's folders of maps the usual LUN ids are tried.
std::optional<NamedMap> findMap(Context& context, const LunName& name);

}  // namespace inspection
