// What a check finds, as values: nothing is worded here.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

#include "map/EntryBits.h"
#include "store/Doubts.h"

namespace inspection {

enum class Rule {
    kind,
    dataStart,
    magic,
    version,
    totalCount,
    mappedCount,
    syncCount,
    poolCount,
    partialEntry,
    unmappedBits,
    addressBits,
    missingDataFile,
    beyondDataFile,
    sharedExtents,
    serialNumber,
    lunSize,
    extentSize,
    missingMap,
    sameMap,
    missingFile
};

/// "shared-extents".
const char* nameOf(Rule rule);

/// Something that is stored, or was found elsewhere.
struct Value {
    enum class Form { number, hexadecimal, text };

    static Value number(std::uint64_t value) { return {Form::number, value, {}}; }
    static Value hexadecimal(std::uint64_t value) { return {Form::hexadecimal, value, {}}; }
    static Value text(std::string value) { return {Form::text, 0, std::move(value)}; }

    Form form;
    std::uint64_t bits;
    std::string words;
};

/// A difference between what a file says and what it or another one holds.
struct Finding {
    /// Entries of a map, in runs of neighbours.
    struct Entries {
        /// `number` neighbouring entries, of which `firstEntry` is the first. Their extents need not be consecutive.
        Entries(std::uint64_t index, std::uint64_t number, const MapEntry& firstEntry)
            : first(index), count(number), entry(firstEntry), entries(number) {}

        std::uint64_t first;  ///< of the first run
        std::uint64_t count;
        MapEntry entry;
        std::uint64_t entries;  ///< in all runs
        std::uint64_t runs = 1;
    };

    /// The other file that a finding is about.
    struct Partner {
        std::string file;
        std::uint64_t first;  ///< of its entries that share extents with the first run
    };

    std::string file;
    Rule rule;
    Value stored;
    Value found;
    std::optional<std::uint32_t> lid = {};       ///< where a LUN is concerned
    std::optional<std::uint32_t> otherLid = {};  ///< where another one is too
    std::optional<Entries> entries = {};         ///< where entries are concerned
    std::optional<Partner> partner = {};         ///< of sharedExtents, and of kind where another file is like this one
    std::optional<KindDoubt> kinds = {};         ///< of kind
    std::optional<DataStartDoubt> dataStart = {};
    std::optional<PartialEntry> partial = {};
    std::uint64_t totalCount = 0;  ///< of lunSize, with the next
    std::uint64_t extentSize = 0;
    std::uint64_t dataFile = 0;  ///< of beyondDataFile and missingDataFile: its number, and the path on the target
    std::string dataFilePath = {};
    std::uint64_t moreLuns = 0;  ///< of missingFile: how many need it beside `lid`
    bool alike = false;    ///< of sharedExtents: all that the two maps share are the same entries, as in a snapshot
    bool passing = false;  ///< possibly so: a file that it is about has changed while it was read
};

}  // namespace inspection
