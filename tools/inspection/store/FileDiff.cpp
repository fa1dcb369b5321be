#include "store/FileDiff.h"

#include <algorithm>
#include <cerrno>
#include <map>

#include "map/MapWalk.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

/// Reads the entries of a map from `first` on, up to `wanted`, into `block`. Reports failures.
bool readBlock(ComparedMap& map, std::uint64_t first, std::uint64_t wanted, std::vector<MapEntry>& block) {
    const auto count = std::min(wanted, map.map.entries - std::min(first, map.map.entries));
    const int error = map.map.file->getMapEntries(first, count, block);
    const int reason = errno;
    const auto failure =
        endOfRead(map.name, first + (error == 0 ? block.size() : 0), error, reason, block.size() == count);
    if (failure) map.context.failed(*failure);
    return !failure;
}

std::vector<StoreFile> filesOf(Store& store) {
    std::vector<StoreFile> files;
    store.forEachFile([&files](const StoreFile& file) {
        if (!file.missing) files.push_back(file);
    });
    return files;
}

}  // namespace

OpenedHeader openHeader(Context& context, const std::string& name, NamedBy by) {
    const std::optional<std::string> path = context.openablePath(name, by);
    if (!path) return {};
    tool::ISCSIEPFile head(*path);
    if (!context.succeeded(head.parseHead0(), {name, ""})) return {};
    const FileKind* kind = kindByType(head.head0Type);
    if (kind == nullptr) kind = kindByName(by == NamedBy::user ? context.root.targetPath(name) : name);
    if (kind == nullptr) {
        context.remark(name, "kind not known from its name or type, only HEAD[0] is compared");
        kind = &headKind;
    }
    auto file = kind->make(*path);
    if (!context.succeeded(kind->parse(*file), {name, ""})) return {};
    return {kind, std::move(file)};
}

std::vector<FieldDifference> fieldDifferencesOf(const tool::ISCSIEPFile& a, const tool::ISCSIEPFile& b) {
    const std::vector<HeaderField> fieldsOfA = headerFieldsOf(a);
    const std::vector<HeaderField> fieldsOfB = headerFieldsOf(b);
    std::vector<FieldDifference> differences;
    for (std::size_t i = 0; i < std::min(fieldsOfA.size(), fieldsOfB.size()); ++i) {
        if (!(fieldsOfA[i] == fieldsOfB[i])) differences.emplace_back(fieldsOfA[i], fieldsOfB[i]);
    }
    return differences;
}

bool compareEntries(ComparedMap& a, ComparedMap& b, const std::function<void(const DiffRun&)>& each) {
    constexpr std::uint64_t blockSize = 4096;
    const std::uint64_t entries = std::max(a.map.entries, b.map.entries);
    std::vector<MapEntry> blockOfA;
    std::vector<MapEntry> blockOfB;
    MapDiff diff;
    bool complete = true;
    for (std::uint64_t first = 0; first < entries && complete; first += blockSize) {
        a.context.progress("entries", first, entries);
        const auto wanted = std::min(entries - first, blockSize);
        complete = readBlock(a, first, wanted, blockOfA) && readBlock(b, first, wanted, blockOfB);
        if (complete) diff.add(first, blockOfA, blockOfB, each);
    }
    diff.finish(each);
    return complete;
}

std::vector<FilePair> pairFiles(Store& a, Store& b) {
    const std::vector<StoreFile> filesOfB = filesOf(b);
    std::map<std::string, std::size_t> places;
    for (std::size_t i = 0; i < filesOfB.size(); ++i) places.emplace(filesOfB[i].path, i);
    std::vector<FilePair> pairs;
    std::size_t next = 0;  // of the second store, up to which its own files are in the list
    for (const StoreFile& file : filesOf(a)) {
        const auto place = places.find(file.path);
        if (place == places.end()) {
            pairs.push_back({file, std::nullopt});
            continue;
        }
        for (; next < place->second; ++next) pairs.push_back({std::nullopt, filesOfB[next]});
        pairs.push_back({file, filesOfB[place->second]});
        next = place->second + 1;
    }
    for (; next < filesOfB.size(); ++next) pairs.push_back({std::nullopt, filesOfB[next]});
    return pairs;
}

}  // namespace inspection
