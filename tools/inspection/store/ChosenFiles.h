// The files that a subcommand is about: those the user named, or all of the store.
#pragma once

#include <functional>
#include <string>
#include <vector>

#include "store/Store.h"

namespace inspection {

class ChosenFiles {
public:
    /// The files in `names`, all of the store where there are none. Loads the LUNs whose ids are in `lids`.
    ChosenFiles(Context& context, const std::vector<std::string>& names, Range lids);

    bool areNamed() const { return !names_.empty(); }

    /// The LUNs found, lowest id first.
    const std::vector<Lun>& luns() const { return store_ ? store_->luns() : luns_; }

    /// Calls each() for the files, in the order of Store::forEachFile() or as they were named, a file that is named
    /// twice, under whatever names, once. Of a named file `path` is the name as typed, the kind is null where its name
    /// tells none, and what is missing is left for the library to find. What may not be opened is reported and left
    /// out.
    void forEach(const std::function<void(const StoreFile&)>& each);

private:
    const Lun* lunOf(const std::string& targetPath) const;

    Context& context_;
    const std::vector<std::string>& names_;
    std::optional<Store> store_;  ///< unless files are named
    std::vector<Lun> luns_;       ///< where files are named
};

}  // namespace inspection
