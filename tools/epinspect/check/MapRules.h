// Rules for a map file: what its header says of its entries, and what the entries point at.
#pragma once

#include <ISCSIEPFileMAP.h>

#include <cstdint>

#include "check/Report.h"
#include "check/VolumeData.h"
#include "map/MapRuns.h"
#include "store/ExtentPlace.h"
#include "store/Store.h"

namespace epinspect {

/// Takes the runs of one map, in their order, from a single walk that serves all rules. Neighbouring entries that break
/// one rule are one finding, which shows the first of them.
class MapRules {
public:
    MapRules(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFileMAP& content, Report& report)
        : file_(file), content_(content), report_(report) {}

    /// Compares entries with the data files too, where extents of `extentSize` bytes lie, not 0.
    void useDataFiles(VolumeData& dataFiles, std::uint32_t extentSize);

    void add(const MapRun& run);

    /// No more entries come; `complete`: these were all.
    void finish(bool complete);

private:
    /// Neighbouring entries that break a rule, as far as they have come, and how they are told.
    struct Stretch {
        void (MapRules::*tell)(const MapRun& entries) const;
        MapRun entries = {};
    };

    void take(Stretch& stretch, const MapRun& part);
    void end(Stretch& stretch);
    void addFinding(const char* rule, const MapRun& entries, const Value& stored, const Value& found,
                    const std::string& message) const;

    void checkCount(const char* rule, std::uint64_t stored, std::uint64_t found, const char* what) const;
    void checkTotalCount() const;
    void checkMappedCount() const;
    void checkSyncCount() const;
    void checkPoolCount() const;
    void checkPartialEntry() const;
    void checkUnmappedBits(const MapRun& run);
    void checkAddressBits(const MapRun& run);
    void checkDataFiles(const MapRun& run);
    void checkDataFile(const MapRun& part, const ExtentPlace& place);

    void tellUnmappedBits(const MapRun& entries) const;
    void tellAddressBits(const MapRun& entries) const;
    void tellMissingDataFile(const MapRun& entries) const;
    void tellBeyondDataFile(const MapRun& entries) const;

    const StoreFile& file_;
    const ISCSI::TOOL::ISCSIEPFileMAP& content_;
    Report& report_;
    MapSummary summary_;
    VolumeData* dataFiles_ = nullptr;
    std::uint32_t extentSize_ = 0;
    bool openBits_ = false;         ///< some entries were not compared with data files: bits 48 to 51 are set
    bool unreadableFiles_ = false;  ///< nor others, whose data file could not be read
    Stretch unmappedBits_ = {&MapRules::tellUnmappedBits};
    Stretch addressBits_ = {&MapRules::tellAddressBits};
    Stretch missingDataFile_ = {&MapRules::tellMissingDataFile};
    Stretch beyondDataFile_ = {&MapRules::tellBeyondDataFile};
};

}  // namespace epinspect
