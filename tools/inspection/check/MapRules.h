// Rules for a map file: its header against its entries, and where the entries point.
#pragma once

#include <ISCSIEPFileMAP.h>

#include <cstdint>
#include <map>

#include "check/Report.h"
#include "map/MapRuns.h"
#include "store/DataFiles.h"
#include "store/ExtentPlace.h"
#include "store/Store.h"

namespace inspection {

/// Takes the runs of one map, in their order, from a single walk that serves all rules. Neighbouring entries that break
/// one rule are one finding; of the rules about data files, one for each data file.
class MapRules {
public:
    MapRules(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFileMAP& content, Report& report)
        : file_(file), content_(content), report_(report) {}

    /// From now on entries are compared with the data files too. Extents have `extentSize` bytes, not 0.
    void useDataFiles(DataFiles& dataFiles, std::uint32_t extentSize);

    void add(const MapRun& run);

    /// No more entries come; `complete`: these were all.
    void finish(bool complete);

    /// The data files that could not be read, by number, and why.
    const std::map<std::uint64_t, Failure>& unreadable() const { return unreadable_; }

private:
    /// Neighbouring entries that break a rule, as far as they have come, and how that is reported.
    struct Stretch {
        void (MapRules::*report)(const Stretch& stretch);
        MapRun run = {};
        std::uint64_t dataFile = 0;  ///< the number of the one that they point into
    };

    void take(Stretch& stretch, const MapRun& part, std::uint64_t dataFile = 0);
    void end(Stretch& stretch);
    Finding findingOf(Rule rule, const Stretch& stretch, const Value& stored, const Value& found) const;
    void addOfDataFile(Rule rule, const Stretch& stretch, const Value& found);

    void checkCount(Rule rule, std::uint64_t stored, std::uint64_t found) const;
    void checkTotalCount() const;
    void checkMappedCount() const;
    void checkSyncCount() const;
    void checkPoolCount() const;
    void checkPartialEntry() const;
    void checkUnmappedBits(const MapRun& run);
    void checkAddressBits(const MapRun& run);
    void checkDataFiles(const MapRun& run);
    void checkDataFile(const MapRun& part, const ExtentPlace& place);

    void reportUnmappedBits(const Stretch& stretch);
    void reportAddressBits(const Stretch& stretch);
    void reportMissingDataFile(const Stretch& stretch);
    void reportBeyondDataFile(const Stretch& stretch);

    const StoreFile& file_;
    const ISCSI::TOOL::ISCSIEPFileMAP& content_;
    Report& report_;
    MapSummary summary_;
    DataFiles* dataFiles_ = nullptr;
    std::uint32_t extentSize_ = 0;
    bool concernsDataFiles_ = false;  ///< a finding does
    bool ambiguousBits_ = false;      ///< some entries were not compared with data files: bits 48 to 51 are set
    std::map<std::uint64_t, Failure> unreadable_;  ///< data files, by number: nothing was compared with these
    Stretch unmappedBits_ = {&MapRules::reportUnmappedBits};
    Stretch addressBits_ = {&MapRules::reportAddressBits};
    Stretch missingDataFile_ = {&MapRules::reportMissingDataFile};
    Stretch beyondDataFile_ = {&MapRules::reportBeyondDataFile};
};

}  // namespace inspection
