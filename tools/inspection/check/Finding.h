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
    missingMap
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
    /// Entries of a map.
    struct Entries {
        std::uint64_t first;
        std::uint64_t count;
        MapEntry entry;  ///< the first one; the others need not be a run
    };

    /// The entries of a map with which others share their extents.
    struct Partner {
        std::string file;
        std::uint64_t first;
    };

    std::string file;
    Rule rule;
    Value stored;
    Value found;
    std::optional<std::uint32_t> lid = {};  ///< where a LUN is concerned
    std::optional<Entries> entries = {};    ///< where entries are concerned
    std::optional<Partner> partner = {};    ///< of sharedExtents
    std::optional<KindDoubt> kinds = {};    ///< of kind
    std::optional<DataStartDoubt> dataStart = {};
    std::optional<PartialEntry> partial = {};
    std::uint64_t totalCount = 0;  ///< of lunSize, with the next
    std::uint64_t extentSize = 0;
    std::uint64_t dataFile = 0;  ///< of beyondDataFile: its number
};

}  // namespace inspection
