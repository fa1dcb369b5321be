#include "check/SharedExtents.h"

#include <algorithm>
#include <functional>
#include <limits>
#include <new>
#include <queue>
#include <set>
#include <tuple>

#include "store/OpenMap.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

/// A list of uses takes up to twice what it holds.
constexpr std::uint64_t growth = 2;

}  // namespace

std::uint64_t SharedExtents::Use::extent() const {
    return bits & (tool::EP_MAP_ENTRY_ADDRESS_MASK | tool::EP_MAP_ENTRY_POOL_MASK);
}

void SharedExtents::beginMap(const std::string& volume, const StoreFile& file, const tool::ISCSIEPFileMAP& content) {
    current_ = &volumes_.try_emplace(volume, memory_).first->second;
    current_->maps.push_back(static_cast<std::uint32_t>(maps_.size()));
    maps_.push_back({file.path, file.hostPath, content.head0UUID, content.parentUUID});
}

void SharedExtents::add(const MapRun& run) {
    if (!run.entry.mapped || !haveAll_) return;
    try {
        current_->adder.add(run.entry.extentAddress, run.count);
    } catch (const std::bad_alloc&) {
        giveUp();
    }
}

void SharedExtents::giveUp() {
    haveAll_ = false;
    volumes_.clear();
    report_.notCompared("shared-extents: the extents in use do not fit into memory");
    context_.fail({"", "shared-extents"}, "out of memory for the extents in use", tool::EP_ERR_READ_FAILED);
}

void SharedExtents::check() {
    try {
        for (auto& volume : volumes_) checkVolume(volume.second);
    } catch (const std::bad_alloc&) {
        giveUp();
    }
}

void SharedExtents::checkVolume(Volume& volume) {
    volume.adder.finish();
    volume.used.clear();
    if (volume.shared.size() == 0) return;
    Uses uses;
    for (const std::uint32_t map : volume.maps) {
        const std::string& path = maps_[map].path;
        const char* lack = nullptr;
        if (!collect(volume, map, uses)) lack = "shared-extents: a map cannot be read again";
        if (report_.hasChanged(path)) lack = "shared-extents: a map has changed while it was read";
        if (lack != nullptr) report_.notCompared(lack, path);
    }
    std::sort(uses.begin(), uses.end(), [](const Use& one, const Use& other) {
        return std::tuple(one.extent(), one.map, one.first) < std::tuple(other.extent(), other.map, other.first);
    });
    Pairs pairs;
    sweep(uses, [&pairs](const Piece& piece) {
        Pair& pair = pairs[{piece.other.map, piece.owner.map}];
        pair.entries += piece.end - piece.start;
        pair.alike = pair.alike && piece.other.map != piece.owner.map &&
                     piece.owner.first - piece.owner.extent() == piece.other.first - piece.other.extent() &&
                     piece.owner.bits - piece.owner.extent() == piece.other.bits - piece.other.extent();
    });
    for (const auto& [maps, pair] : pairs) {
        const Map& one = maps_[maps.first];
        const Map& other = maps_[maps.second];
        if (pair.alike && isParent(other, one)) report_.addSnapshot({one.path, other.path, pair.entries});
        if (pair.alike && isParent(one, other)) report_.addSnapshot({other.path, one.path, pair.entries});
    }
    sweep(uses, [&](const Piece& piece) {
        const bool alike = pairs[{piece.other.map, piece.owner.map}].alike;
        const Map& one = maps_[piece.other.map];
        const Map& other = maps_[piece.owner.map];
        if (!alike || !(isParent(one, other) || isParent(other, one))) reportPiece(piece, alike);
    });
    memory_.give(growth * sizeof(Use) * uses.size());
    volume.shared.clear();
}

/// Walks a map for the uses of shared extents. False when not all of it could be read.
bool SharedExtents::collect(Volume& volume, std::uint32_t map, Uses& uses) {
    constexpr std::uint64_t most = std::numeric_limits<std::uint32_t>::max();
    return walkAgain(context_, maps_[map].path, maps_[map].hostPath, [&](const MapRun& run) {
        if (!run.entry.mapped) return;
        const std::uint64_t start = run.entry.extentAddress;
        volume.shared.forEachIn(start, run.count, [&](std::uint64_t extent, std::uint64_t count) {
            for (std::uint64_t done = 0; done < count; done += most) {
                const std::uint64_t skipped = extent - start + done;
                append(uses, {bitsOf(run.entry) + skipped, run.first + skipped,
                              static_cast<std::uint32_t>(std::min(count - done, most)), map});
            }
        });
    });
}

void SharedExtents::append(Uses& uses, const Use& use) {
    if (!uses.empty()) {
        constexpr auto most = std::numeric_limits<std::uint32_t>::max();
        Use& before = uses.back();
        if (before.map == use.map && before.bits + before.count == use.bits &&
            before.first + before.count == use.first && before.count <= most - use.count) {
            before.count += use.count;
            return;
        }
    }
    memory_.take(growth * sizeof use);
    uses.push_back(use);
}

/// Calls each(piece) for what the uses, in the order of their extents, share. The first of several uses of an extent,
/// by map and entry, is its owner.
template <typename Each>
void SharedExtents::sweep(const Uses& uses, Each&& each) {
    struct Open {
        const Use* use;
        mutable const Use* owner;  ///< null where it is the owner itself
        mutable std::uint64_t since;

        bool operator<(const Open& other) const {
            return std::tie(use->map, use->first) < std::tie(other.use->map, other.use->first);
        }
    };
    std::set<Open> open;
    const auto laterEnd = [](const Use* one, const Use* other) { return one->end() > other->end(); };
    std::priority_queue<const Use*, std::vector<const Use*>, decltype(laterEnd)> ends(laterEnd);
    const auto finish = [&each](const Open& one, std::uint64_t at) {
        if (one.owner != nullptr && one.since < at) each(Piece{*one.owner, *one.use, one.since, at});
    };
    const auto setOwner = [&](std::uint64_t at) {
        for (const Open& one : open) {
            finish(one, at);
            one.owner = &one == &*open.begin() ? nullptr : open.begin()->use;
            one.since = at;
        }
    };
    for (auto next = uses.begin(); next != uses.end() || !ends.empty();) {
        const bool ending = !ends.empty() && (next == uses.end() || ends.top()->end() <= next->extent());
        const Use& use = ending ? *ends.top() : *next++;
        const std::uint64_t at = ending ? use.end() : use.extent();
        if (ending) {
            ends.pop();
            const auto ended = open.find({&use, nullptr, 0});
            const bool wasOwner = ended == open.begin();
            finish(*ended, at);
            open.erase(ended);
            if (wasOwner) setOwner(at);
        } else {
            ends.push(&use);
            const auto begun = open.insert({&use, open.empty() ? nullptr : open.begin()->use, at}).first;
            if (begun == open.begin()) setOwner(at);
        }
    }
}

/// Whether `one` is the map that the other one names as its parent.
bool SharedExtents::isParent(const Map& one, const Map& other) {
    return one.uuid == other.parentUUID && one.uuid != other.uuid &&
           one.uuid.find_first_not_of("0-") != std::string::npos;
}

void SharedExtents::reportPiece(const Piece& piece, bool alike) {
    const std::uint64_t skipped = piece.start - piece.other.extent();
    const MapEntry entry = mappedEntry(piece.other.bits + skipped);
    Finding finding = {maps_[piece.other.map].path, Rule::sharedExtents, Value::number(entry.extentAddress),
                       Value::text(maps_[piece.owner.map].path)};
    finding.entries = Finding::Entries(piece.other.first + skipped, piece.end - piece.start, entry);
    finding.partner =
        Finding::Partner{maps_[piece.owner.map].path, piece.owner.first + (piece.start - piece.owner.extent())};
    finding.alike = alike;
    report_.add(std::move(finding));
}

}  // namespace inspection
