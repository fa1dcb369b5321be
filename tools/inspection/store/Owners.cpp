#include "store/Owners.h"

#include <etc/ISCSIEPDiagnostics.h>

#include <algorithm>
#include <limits>
#include <new>
#include <set>
#include <string>
#include <tuple>

#include "store/OpenMap.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

/// Calls each(wanted, part) for those of `all`, in the order of first and of last extents, that share the part with
/// `count` extents from `address` on.
template <typename All, typename Each>
void forEachOverlap(const All& all, std::uint64_t address, std::uint64_t count, Each&& each) {
    const std::uint64_t last = address + count - 1;
    auto wanted = std::lower_bound(all.begin(), all.end(), address,
                                   [](const auto& one, std::uint64_t extent) { return one.extents.last < extent; });
    for (; wanted != all.end() && wanted->extents.first <= last; ++wanted) {
        each(*wanted, Range{std::max(address, wanted->extents.first), std::min(last, wanted->extents.last)});
    }
}

/// The part of an owner from the byte `position` after the data start on.
Owner partFrom(const Owner& owner, std::uint64_t position) {
    const std::uint64_t skipped = (position - owner.start) / *owner.map->extentSize;
    Owner part = owner;
    part.start += skipped * *owner.map->extentSize;
    part.count -= skipped;
    part.index += skipped;
    part.entry.extentAddress += skipped;
    return part;
}

}  // namespace

Owners::Owners(Context& context, const Volume& volume, const DataFile& data, std::uint64_t number,
               const PlaceChoice& choice)
    : context_(context), volume_(volume), data_(data), number_(number), choice_(choice), complete_(volume.complete) {}

bool Owners::find(const std::vector<Range>& positions) {
    const std::uint64_t before = context_.failures();
    try {
        setTargets(positions);
        for (const VolumeMap& map : volume_.maps) walk(map);
        for (Target& target : targets_) {
            std::stable_sort(target.owners.begin(), target.owners.end(),
                             [](const Owner& one, const Owner& other) { return one.start < other.start; });
        }
    } catch (const std::bad_alloc&) {
        context_.fail({data_.path, ""}, "out of memory for the owners of so many positions", tool::EP_ERR_READ_FAILED);
        return false;
    }
    complete_ = complete_ && context_.failures() == before;
    return true;
}

/// Takes what comes after the data start, as stretches that do not touch each other.
void Owners::setTargets(const std::vector<Range>& positions) {
    const std::uint64_t start = data_.file->head0DataStartOffset;
    std::vector<Range> wanted;
    for (const Range& range : positions) {
        if (range.last >= start) wanted.push_back({std::max(range.first, start) - start, range.last - start});
    }
    std::sort(wanted.begin(), wanted.end(),
              [](const Range& one, const Range& other) { return one.first < other.first; });
    for (const Range& range : wanted) {
        if (targets_.empty() || range.first > targets_.back().bytes.last + 1) {
            targets_.push_back({range, {}});
        } else {
            targets_.back().bytes.last = std::max(targets_.back().bytes.last, range.last);
        }
    }
}

std::vector<Owners::Way> Owners::waysFor(std::uint32_t extentSize) const {
    const std::uint64_t first = firstExtentOf(number_, extentSize);
    const std::uint64_t next = std::min(firstExtentOf(number_ + 1, extentSize), (std::uint64_t{1} << 63U) / extentSize);
    const CountFrom usual = choice_.countFrom.value_or(CountFrom::file);
    std::vector<Way> ways;
    if (usual == CountFrom::file || first == 0) ways.push_back({usual, first, {}});
    if (first > 0 && choice_.countFrom != CountFrom::file) ways.push_back({CountFrom::volume, 0, {}});
    for (Way& way : ways) {
        // What would lie past the end if counted from the volume's start lies within the file, unless that is excluded.
        const bool onlyInside = way.countFrom == CountFrom::volume && !choice_.countFrom;
        for (std::size_t target = 0; target < targets_.size(); ++target) {
            Range bytes = targets_[target].bytes;
            if (onlyInside && bytes.first >= data_.dataSize) continue;
            if (onlyInside) bytes.last = std::min(bytes.last, data_.dataSize - 1);
            const Range extents = {std::max(way.firstExtent + bytes.first / extentSize, first),
                                   std::min(way.firstExtent + bytes.last / extentSize, next - 1)};
            if (next > first && extents.first <= extents.last) way.wanted.push_back({extents, target});
        }
    }
    return ways;
}

void Owners::walk(const VolumeMap& map) {
    if (!map.extentSize) return;  // which has been reported
    const OpenedMap opened = openMap(context_, map.file.path, map.file.by);
    if (opened.file == nullptr) return;
    const std::vector<Way> ways = waysFor(*map.extentSize);
    walkAllRuns(context_, map.file.path, *opened.file, opened.entries, [&](const MapRun& run) {
        if (!run.entry.mapped) return;
        if (const auto address = extentAddressOf(run.entry, choice_)) {
            take(map, ways, run, *address);
        } else if (!reportAmbiguous(map, ways, run, AddressBits::bits48)) {
            reportAmbiguous(map, ways, run, AddressBits::bits52);
        }
    });
    opened.watch->noticeChange();
}

void Owners::take(const VolumeMap& map, const std::vector<Way>& ways, const MapRun& run, std::uint64_t address) {
    for (const Way& way : ways) {
        forEachOverlap(way.wanted, address, run.count, [&](const Wanted& wanted, const Range& extents) {
            memory_.take(2 * sizeof(Owner));  // a list holds up to twice as many while it grows
            const std::uint64_t skipped = extents.first - address;
            Owner owner = {&map,
                           way.countFrom,
                           (extents.first - way.firstExtent) * *map.extentSize,
                           extents.last - extents.first + 1,
                           run.first + skipped,
                           run.entry};
            owner.entry.extentAddress += skipped;
            targets_[wanted.target].owners.push_back(owner);
        });
    }
}

/// Whether entries, their ambiguous bits taken in one way, would be owners; which is then reported.
bool Owners::reportAmbiguous(const VolumeMap& map, const std::vector<Way>& ways, const MapRun& run, AddressBits bits) {
    const std::uint64_t address = readAs(run.entry, bits).extent;
    bool any = false;
    for (const Way& way : ways) {
        forEachOverlap(way.wanted, address, run.count, [&](const Wanted&, const Range& extents) {
            if (any) return;
            any = true;
            MapEntry entry = run.entry;
            entry.extentAddress += extents.first - address;
            const std::string index = std::to_string(run.first + (extents.first - address));
            context_.fail({map.file.path, "entry " + index}, "may be an owner: " + ambiguousAddressText(entry),
                          tool::EP_ERR_NO_PATH);
        });
    }
    return any;
}

void Owners::forEachPart(const Range& positions, const std::function<void(const OwnedRange&)>& each) const {
    using Where = OwnedRange::Where;
    const std::uint64_t start = data_.file->head0DataStartOffset;
    std::optional<OwnedRange> last;
    const auto finish = [&] {
        if (last) each(*last);
    };
    const auto take = [&](const OwnedRange& part) {  // neighbours without owners are one
        if (last && last->where == part.where && last->owners.empty() && part.owners.empty()) {
            last->length += part.length;
        } else {
            finish();
            last = part;
        }
    };
    const auto withoutOwners = [&](Where where, std::uint64_t from, std::uint64_t to) {
        const Range part = {std::max(positions.first, from), std::min(positions.last, to - 1)};
        if (to > from && part.first <= part.last) take({where, part.first, part.last - part.first + 1});
    };
    withoutOwners(Where::header, 0, std::min(start, data_.size));
    withoutOwners(Where::pastEnd, data_.size, start);
    if (positions.last < start) return finish();
    const Range bytes = {std::max(positions.first, start) - start, positions.last - start};
    const auto target =
        std::lower_bound(targets_.begin(), targets_.end(), bytes.first,
                         [](const Target& one, std::uint64_t position) { return one.bytes.last < position; });
    if (target != targets_.end()) addParts(*target, bytes, take);
    finish();
}

/// Bytes of the owner's extents before this one would lie inside the data file by the other way of counting too.
std::uint64_t Owners::undecidedBefore(const Owner& owner) const {
    const std::uint64_t shift = firstExtentOf(number_, *owner.map->extentSize) * *owner.map->extentSize;
    if (shift == 0 || choice_.countFrom) return 0;
    if (owner.countFrom == CountFrom::volume) return std::numeric_limits<std::uint64_t>::max();
    return data_.dataSize - std::min(data_.dataSize, shift);
}

void Owners::addParts(const Target& target, Range bytes, const std::function<void(const OwnedRange&)>& each) const {
    const std::uint64_t start = data_.file->head0DataStartOffset;
    std::vector<const Owner*> here;
    auto next = target.owners.begin();
    for (std::uint64_t position = bytes.first; position <= bytes.last;) {
        for (; next != target.owners.end() && next->start <= position; ++next) here.push_back(&*next);
        here.erase(std::remove_if(here.begin(), here.end(),
                                  [position](const Owner* owner) { return owner->end() <= position; }),
                   here.end());
        std::uint64_t end = bytes.last + 1;
        if (next != target.owners.end()) end = std::min(end, next->start);
        const bool inside = position < data_.dataSize;
        if (inside) end = std::min(end, data_.dataSize);
        OwnedRange part = {inside ? OwnedRange::Where::extent : OwnedRange::Where::pastEnd, start + position, 0};
        for (const Owner* owner : here) {
            const bool onlyInside = owner->countFrom == CountFrom::volume && !choice_.countFrom;
            if (!inside && onlyInside) continue;
            end = std::min(end, owner->end());
            part.owners.push_back(partFrom(*owner, position));
            const std::uint64_t undecidedEnd = undecidedBefore(*owner);
            part.owners.back().undecided = position < undecidedEnd;
            if (position < undecidedEnd) end = std::min(end, undecidedEnd);
        }
        std::sort(part.owners.begin(), part.owners.end(), [](const Owner& one, const Owner& other) {
            return std::tie(one.map, one.index) < std::tie(other.map, other.index);
        });
        part.length = end - position;
        each(part);
        position = end;
    }
}

}  // namespace inspection
