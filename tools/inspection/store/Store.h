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
#include "store/FileIdentity.h"
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
    const FileKind* kind = nullptr;  ///< what its name tells; null where it tells none, as a file named by the user may
    std::string path;                ///< what messages call it: its path on the target, unless the user named it
    NamedBy by = NamedBy::target;    ///< where `path` comes from
    std::string targetPath;          ///< on the target, in plain form
    std::string hostPath;            ///< where it is to be opened here
    std::uint64_t size = 0;
    std::optional<FileIdentity> identity;  ///< nothing where it is missing
    bool missing = false;                  ///< nothing is there, though a LUN should have it or a link leads there
    std::uint32_t volume = 0;              ///< 0: on no volume
    bool misnamed = false;                 ///< named like a data file, but not as the target names one
    std::optional<std::string> link;       ///< what is stored in the link that lies there, if it is one
    std::string sameAs;                    ///< the path of an earlier file that is the same one, under another name
    std::vector<const Lun*> luns;          ///< of a map file: whose it is by the configuration, lowest id first
    std::optional<MapName> mapName;        ///< of a map file, where the parts of its name are known

    /// The LUN whose map this is: the first where there are several; null where none is known.
    const Lun* lun() const { return luns.empty() ? nullptr : luns.front(); }
};

/// The store below the root folder.
class Store {
public:
    /// Loads the LUNs whose ids are in `lids`, as forEachLun() does. That the store is an incomplete collection is a
    /// failure.
    Store(Context& context, const Lids& lids);

    /// With these LUNs, lowest id first.
    Store(Context& context, std::vector<Lun> luns);

    /// The LUNs found, lowest id first; none at all where there is no configuration.
    const std::vector<Lun>& luns() const { return luns_; }

    /// Calls each() for the files, whose bytes are not read: journal, then volume by volume table, free-index, data and
    /// map files, then map files on no volume. Those that a configured LUN should have (its map file, the table and
    /// free-index file of its volume, the journal) are among them when they are missing. What may not be opened or
    /// cannot be looked at is reported and skipped; a folder that is closed is reported once, whatever lies in it.
    void forEachFile(const std::function<void(const StoreFile&)>& each);

private:
    /// Folders that may hold files of the store, in the order of forEachFile(): by volume, the journal's first.
    using Place = std::pair<std::uint64_t, std::string>;

    void expect(const std::string& path);
    std::vector<std::string> namesIn(const std::string& folder);
    std::vector<std::string> storeFilesIn(const std::string& folder, std::set<std::string> expected);
    std::optional<StoreFile> fileAt(const std::string& path, bool isExpected);
    void describe(StoreFile& file);
    void reportOnce(const Failure& failure);

    Context& context_;
    std::vector<Lun> luns_;
    LunsByMap lunsByMap_;
    std::map<Place, std::set<std::string>> folders_;  ///< with the names of what should lie there
    std::set<std::string> reported_;                  ///< what could not be looked at
    std::map<FileIdentity, std::string> firstPaths_;  ///< of the files that forEachFile() has met
};

}  // namespace inspection
