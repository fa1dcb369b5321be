// The files that a subcommand is about: those the user named, or all of the store.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "store/NamedMap.h"
#include "store/Store.h"

namespace inspection {

class ChosenFiles {
public:
    /// The files in `names`, of a LUN id its map; all of the store where there are none. Loads the LUNs whose ids are
    /// in `lids`, or are names, and reports what fails; but where files are named it is no news that there is no LUN.
    ChosenFiles(Context& context, const std::vector<LunName>& names, const Lids& lids);

    bool areNamed() const { return !names_.empty(); }

    /// The LUNs found, lowest id first.
    const std::vector<Lun>& luns() const { return store_ ? store_->luns() : luns_; }

    /// Calls each() for the files, in the order of Store::forEachFile() or as they were named, a file that is named
    /// twice, under whatever names, once. Of a named file `path` is the name as typed or the path of the LUN's map, the
    /// kind is null where its name tells none, and what is missing is left for the library to find. What may not be
    /// opened is reported and left out.
    void forEach(const std::function<void(const StoreFile&)>& each);

private:
    void loadNamed(const Lids& lids);
    const Lun* lunOf(std::uint32_t lid) const;

    Context& context_;
    const std::vector<LunName>& names_;
    std::optional<Store> store_;  ///< unless files are named
    std::vector<Lun> luns_;       ///< where files are named, lowest id first
    LunsByMap lunsByMap_;
};

}  // namespace inspection
