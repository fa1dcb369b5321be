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
    /// The files in `names`, where a LUN id stands for its map; all of the store where there are no names. Loads the
    /// LUNs with these ids and with the ids in `lids`, and reports what fails. That there is no LUN at all is not
    /// reported where files are named, unless the user asked for `lids` or the configuration cannot be read.
    ChosenFiles(Context& context, const std::vector<LunName>& names, const Lids& lids);

    bool areNamed() const { return !names_.empty(); }

    /// The LUNs found, lowest id first.
    const std::vector<Lun>& luns() const { return store_ ? store_->luns() : luns_; }

    /// Calls each() for the files, in the order of Store::forEachFile() or as they were named; once for each file, even
    /// if it is named twice. Of a named file `path` is the name as typed or the path of the LUN's map, and the kind is
    /// null where its name tells none. A named file that is missing is passed on; the library will fail to open it.
    /// What may not be opened is reported and skipped.
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
