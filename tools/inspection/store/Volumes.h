// The volumes of a store: their map files, with the bytes of an extent of each, and their data files.
#pragma once

#include <cstddef>
#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <utility>
#include <vector>

#include "store/ChosenFiles.h"
#include "store/Store.h"

namespace inspection {

struct VolumeMap {
    StoreFile file;
    std::optional<std::uint32_t> extentSize;  ///< nothing where it is not known; never 0
    bool asked = true;                        ///< the user named this map, or none
};

struct Volume {
    std::uint32_t number = 0;  ///< 0: the maps' path names no volume
    std::string folder;        ///< "/volume1"; of maps on no volume their folder
    std::vector<VolumeMap> maps;
    std::vector<StoreFile> dataFiles;
    bool complete = true;  ///< all its maps were found, and how their extents compare is known
};

/// Which maps are looked at, and how the bytes of their extents are known.
struct VolumesChoice {
    std::vector<LunName> names;           ///< none: the maps of all volumes, or of one
    std::optional<std::uint32_t> number;  ///< of that one volume
    Lids lids = usualLids;
    std::optional<std::uint32_t> extentSize;  ///< of maps whose LUN is not known
    bool sizeOfAll = false;                   ///< of all others too
};

class Volumes {
public:
    /// The volumes that the choice names, each with all its maps. A file of several names counts once. Loads LUNs as
    /// ChosenFiles does, and reports what fails; that includes a map whose extent size is not known.
    Volumes(Context& context, const VolumesChoice& choice);

    /// Calls each(volume) in the order of their numbers, those without one last.
    template <typename Each>
    void forEach(Each&& each) const {
        for (const auto& volume : volumes_) each(volume.second);
    }

    /// The one of that number; null when nothing lies on it.
    const Volume* find(std::uint32_t number) const;

    /// Whether the store has any EP file.
    bool any() const { return any_; }

private:
    /// The number, less one so that none comes last; and the folder.
    using Key = std::pair<std::uint32_t, std::string>;

    static Key keyOf(const StoreFile& file);
    Volume& volumeOf(const StoreFile& file);
    void addMap(const StoreFile& file, bool asked);
    void addName(VolumeMap& map, const StoreFile& file);
    void findNamed();
    void addFile(const StoreFile& file);
    void settleSizes(Volume& volume);
    void reportUnknownSize(const StoreFile& map);

    Context& context_;
    const VolumesChoice& choice_;
    std::uint64_t failuresBefore_;
    ChosenFiles chosen_;
    std::optional<Store> store_;  ///< beside named maps
    std::map<Key, Volume> volumes_;
    std::vector<VolumeMap> maps_;                 ///< of all volumes, until all are known
    std::map<FileIdentity, std::size_t> places_;  ///< of files among them
    std::set<FileIdentity> notYetListed_;         ///< named maps that the store has not listed
    bool any_ = false;
};

}  // namespace inspection
