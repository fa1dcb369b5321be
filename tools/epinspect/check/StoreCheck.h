// The check of a store, or of some of its files: which rules are held against which file.
#pragma once

#include <ISCSIEPFileMAP.h>

#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "Session.h"
#include "check/HeadRules.h"
#include "check/MapRules.h"
#include "check/Report.h"
#include "check/SharedExtents.h"
#include "check/VolumeData.h"
#include "store/ChosenFiles.h"
#include "store/Luns.h"

namespace epinspect {

struct CheckOptions {
    std::vector<std::string> files;  ///< none: all of the store
    Range lids = usualLids;
    std::optional<std::uint32_t> extentSize;  ///< of maps whose LUN is not known
};

class StoreCheck {
public:
    StoreCheck(Session& session, const CheckOptions& options)
        : session_(session), options_(options), files_(session, options.files, options.lids), report_(session) {}

    void run();

private:
    void checkFile(const StoreFile& file);
    void checkMissing(const StoreFile& file);
    void checkContent(const StoreFile& file, const FileKind& kind, ISCSI::TOOL::ISCSIEPFile& content, bool isKind);
    void checkMap(const StoreFile& file, ISCSI::TOOL::ISCSIEPFileMAP& content);
    void useDataFiles(const StoreFile& file, MapRules& rules);
    void checkExtentSizes();
    void checkSharedExtents();
    std::optional<std::uint32_t> tableExtentSize(const std::string& path);

    Session& session_;
    const CheckOptions& options_;
    ChosenFiles files_;
    Report report_;
    CommonValues commonValues_;
    SharedExtents sharedExtents_;
    std::set<std::string> checked_;                               ///< paths on the target
    std::set<std::string> foldersWithoutVolume_;                  ///< with map files
    std::map<std::uint32_t, VolumeData> dataFiles_;               ///< by volume
    std::map<std::string, std::optional<std::uint32_t>> tables_;  ///< extent sizes of table files that could be read
};

}  // namespace epinspect
