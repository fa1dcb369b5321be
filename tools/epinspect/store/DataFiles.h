// The data files that a map's entries point into.
#pragma once

#include <ISCSIEPFileDAT.h>

#include <cstdint>
#include <map>
#include <memory>
#include <string>

#include "Session.h"
#include "store/ExtentPlace.h"

namespace epinspect {

/// A data file, opened once, or what went wrong with that.
struct DataFile {
    std::string path;  ///< on the target; empty when the map file's path names no volume
    std::unique_ptr<ISCSI::TOOL::ISCSIEPFileDAT> file;  ///< its HEAD[0] is decoded; null after a failure
    std::uint64_t dataSize = 0;                         ///< bytes from the data start offset to the end
    int error = 0;                                      ///< code of the failure
    int reason = 0;                                     ///< errno value of the failure
};

/// The data files of one volume. Keeps those that were used, up to a limit.
class DataFiles {
public:
    /// `mapPath`: where the map file lies on the target.
    DataFiles(Session& session, std::string mapPath, std::uint32_t extentSize)
        : session_(session), mapPath_(std::move(mapPath)), extentSize_(extentSize) {}

    /// The data file of a place. The reference holds until the next call.
    const DataFile& at(const ExtentPlace& place);

private:
    DataFile open(const ExtentPlace& place);

    Session& session_;
    std::string mapPath_;
    std::uint32_t extentSize_;
    std::map<std::uint64_t, DataFile> files_;  ///< by number
};

}  // namespace epinspect
