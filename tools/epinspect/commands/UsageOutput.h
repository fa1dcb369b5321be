// How the use of a volume's space is shown.
#pragma once

#include <cstdint>
#include <set>
#include <string>

#include "frame/Inspection.h"
#include "frame/Session.h"
#include "store/ExtentsInUse.h"

namespace epinspect {

class UsageOutput {
public:
    UsageOutput(const Session& session, bool chart) : session_(session), chart_(chart) {}

    /// Shows what uses extents of one size on one volume.
    void print(const ExtentsInUse& use);

    /// There is a volume whose use could not be counted: the totals are then not those of all.
    void leaveOut() { isAll_ = false; }

    /// Totals of all that was printed.
    void printSummary() const;

private:
    void printAsJson(const ExtentsInUse& use);
    static void writeMap(const ExtentsInUse& use, const MapUse& map);
    static void writeDataFile(const ExtentsInUse& use, const DataFileUse& file);
    static void drawDataFile(const ExtentsInUse& use, const DataFileUse& file);

    const Session& session_;
    bool chart_;
    bool isAll_ = true;
    bool isSure_ = true;  ///< all maps that could share an extent could be read
    std::set<std::string> dataFiles_;
    std::uint64_t maps_ = 0, mapped_ = 0, extents_ = 0, shared_ = 0;
};

}  // namespace epinspect
