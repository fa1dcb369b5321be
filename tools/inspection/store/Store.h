// The files that make up a store: what lies where, and what should lie there.
#pragma once

#include <cstdint>
#include <functional>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <string_view>
#include <utility>
#include <vector>

#include "Range.h"
#include "store/Context.h"
#include "store/FileKind.h"
#include "store/FileNames.h"
#include "store/Luns.h"

namespace inspection {

/// The volume on which a file at `path` of the target lies, 0 when the path names none.
std::uint32_t volumeOf(Context& context, const std::string& path);

/// Reports that there is no store below the root folder.
void failEmptyStore(Context& context);

/// A file of the store.
struct StoreFile {
    const FileKind* kind = nullptr;  ///< what its name tells; never null
    std::string path;                ///< on the target
    std::string hostPath;            ///< where it is to be opened here
    std::uint64_t size = 0;
    bool missing = false;            ///< nothing is there, though a LUN should have it or a link leads there
    std::uint32_t volume = 0;        ///< 0: on no volume
    std::vector<const Lun*> luns;    ///< of a map file: those that the configuration tells it is of, lowest id first
    std::optional<MapName> mapName;  ///< of a map file, where the parts of its name are known

    /// The LUN whose map this is: the first where there are several; null where none is known.
    const Lun* lun() const { return luns.empty() ? nullptr : luns.front(); }
};

/// The store below the root folder.
class Store {
public:
    /// Loads the LUNs whose ids are in `lids`, as forEachLun() does.
    Store(Context& context, const Lids& lids);

    /// The LUNs found, lowest id first; none at all where there is no configuration.
    const std::vector<Lun>& luns() const { return luns_; }

    /// Calls each() for the files, whose bytes are not read: journal, then volume by volume table, free-index, data and
    /// map files, then map files on no volume. Those that a configured LUN should have (its map file, the table and
    /// free-index file of its volume, the journal) are among them when they are missing. What may not be opened or
    /// cannot be looked at is reported and left out.
    void forEachFile(const std::function<void(const StoreFile&)>& each);

private:
    /// Folders that may hold files of the store, in the order of forEachFile(): by volume, the journal's first.
    using Place = std::pair<std::uint64_t, std::string>;

    void expect(const std::string& path);
    std::vector<std::string> namesIn(const std::string& folder, std::set<std::string> names);
    std::optional<StoreFile> fileAt(const std::string& path);

    Context& context_;
    std::vector<Lun> luns_;
    LunsByMap lunsByMap_;
    std::map<Place, std::set<std::string>> folders_;  ///< with the names of what should lie there
};

}  // namespace inspection
