#include "store/Volumes.h"

#include <etc/ISCSIEPDiagnostics.h>
#include <etc/ISCSIEPFormat.h>

#include <algorithm>
#include <limits>
#include <set>
#include <utility>

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

std::string folderOf(std::uint32_t volume) { return tool::EP_VOLUME_PREFIX + std::to_string(volume); }

bool isOfType(const StoreFile& file, unsigned int type) { return file.kind != nullptr && file.kind->type == type; }

}  // namespace

Volumes::Volumes(Context& context, const VolumesChoice& choice)
    : context_(context),
      choice_(choice),
      failuresBefore_(context.failures()),
      chosen_(context, choice.names, choice.lids) {
    if (chosen_.areNamed()) {
        findNamed();
    } else {
        chosen_.forEach([this](const StoreFile& file) { addFile(file); });
    }
    for (const VolumeMap& map : maps_) volumeOf(map.file).maps.push_back(map);
    const bool complete = context.failures() == failuresBefore_;
    for (auto& [key, volume] : volumes_) {
        volume.complete = complete;
        settleSizes(volume);
    }
}

const Volume* Volumes::find(std::uint32_t number) const {
    const auto found = volumes_.find({number - 1, folderOf(number)});
    return found != volumes_.end() ? &found->second : nullptr;
}

Volumes::Key Volumes::keyOf(const StoreFile& file) {
    return {file.volume - 1,
            file.volume != 0 ? folderOf(file.volume) : file.targetPath.substr(0, file.targetPath.rfind('/'))};
}

Volume& Volumes::volumeOf(const StoreFile& file) {
    const Key key = keyOf(file);
    const auto [volume, added] = volumes_.try_emplace(key);
    if (added) {
        volume->second.number = file.volume;
        volume->second.folder = key.second;
    }
    return volume->second;
}

void Volumes::findNamed() {
    chosen_.forEach([this](const StoreFile& file) {
        if (file.identity) notYetListed_.insert(*file.identity);
        volumeOf(file);
        addMap(file, true);
    });
    store_.emplace(context_, chosen_.luns());
    store_->forEachFile([this](const StoreFile& file) {
        if (volumes_.count(keyOf(file)) > 0) addFile(file);
    });
    for (const VolumeMap& map : maps_) {
        if (map.file.volume == 0 && map.file.identity && notYetListed_.count(*map.file.identity) > 0) {
            context_.fail({map.file.path, ""},
                          "its path names no volume: which other maps share its extents is not known",
                          tool::EP_ERR_NO_PATH);
        }
    }
}

void Volumes::addFile(const StoreFile& file) {
    any_ = true;
    if (choice_.number && *choice_.number != file.volume) return;
    if (isOfType(file, tool::EP_FILE_TYPE_DAT)) {
        volumeOf(file).dataFiles.push_back(file);
        return;
    }
    if (!isOfType(file, tool::EP_FILE_TYPE_MAP)) return;
    const auto place = file.identity ? places_.find(*file.identity) : places_.end();
    if (place != places_.end()) return addName(maps_[place->second], file);
    const bool isNamed = file.missing && std::any_of(maps_.begin(), maps_.end(), [&file](const VolumeMap& map) {
                             return map.file.targetPath == file.targetPath;
                         });
    if (!isNamed) addMap(file, !chosen_.areNamed());
}

void Volumes::addMap(const StoreFile& file, bool asked) {
    if (file.identity) places_.emplace(*file.identity, maps_.size());
    maps_.push_back({file, {}, asked});
}

/// Takes what another name of a map tells of its LUNs. By which name the map goes: the one that the user typed, else
/// one that a LUN has.
void Volumes::addName(VolumeMap& map, const StoreFile& file) {
    if (notYetListed_.erase(*file.identity) == 0) {
        context_.remark(file.path, "the same file as " + map.file.path + ", which counts once");
    }
    std::vector<const Lun*> luns = map.file.luns;
    for (const Lun* lun : file.luns) {
        const auto place = std::lower_bound(luns.begin(), luns.end(), lun, [](const Lun* one, const Lun* other) {
            return one->record.lid < other->record.lid;
        });
        if (place == luns.end() || (*place)->record.lid != lun->record.lid) luns.insert(place, lun);
    }
    if (map.file.luns.empty() && !file.luns.empty() && !chosen_.areNamed()) map.file = file;
    map.file.luns = std::move(luns);
}

/// A map whose extent size is not known cannot be held against the others.
void Volumes::settleSizes(Volume& volume) {
    for (VolumeMap& map : volume.maps) {
        const Lun* lun = map.file.lun();
        const bool asGiven = lun == nullptr || (choice_.sizeOfAll && choice_.extentSize);
        map.extentSize = asGiven ? choice_.extentSize : lun->record.extentSize;
        if (map.extentSize.value_or(0) != 0) continue;
        if (lun == nullptr) {
            reportUnknownSize(map.file);
        } else {
            context_.failed({subjectOf({lun->record.lid, lun->record.lid}), tool::EP_ERR_BAD_EXTENT_SIZE, 0, {}});
        }
        map.extentSize.reset();
        volume.complete = false;
    }
}

void Volumes::reportUnknownSize(const StoreFile& map) {
    context_.fail(
        {map.path, ""},
        "extent size not known, give --extent-size: no LUN with " + idsText(choice_.lids) + " has this map file",
        tool::EP_ERR_BAD_EXTENT_SIZE);
}

}  // namespace inspection
