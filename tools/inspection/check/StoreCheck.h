// The check of a store, or of some of its files: which rules are applied to which file.
#pragma once

#include <ISCSIEPFileMAP.h>

#include <cstdint>
#include <map>
#include <optional>
#include <set>
#include <string>
#include <vector>

#include "check/HeadRules.h"
#include "check/KindRules.h"
#include "check/LunRules.h"
#include "check/MapRules.h"
#include "check/Report.h"
#include "check/SharedExtents.h"
#include "store/ChosenFiles.h"
#include "store/DataFiles.h"
#include "store/Luns.h"

namespace inspection {

struct CheckOptions {
    std::vector<LunName> files;  ///< none: all of the store
    Lids lids = usualLids;
    std::optional<std::uint32_t> extentSize;  ///< of maps whose LUN is not known
};

class StoreCheck {
public:
    StoreCheck(Context& context, const CheckOptions& options, Report& report)
        : context_(context),
          options_(options),
          files_(context, options.files, options.lids),
          report_(report),
          sharedExtents_(context, report) {}

    /// To be called once. What cannot be read is reported to the context.
    void run();

private:
    void checkFile(const StoreFile& file);
    void checkMissing(const StoreFile& file);
    MissingFile missingAt(const std::string& path, const std::string& hostPath) const;
    void checkContent(const StoreFile& file, const FileKind& kind, ISCSI::TOOL::ISCSIEPFile& content, bool isKind);
    void checkMap(const StoreFile& file, ISCSI::TOOL::ISCSIEPFileMAP& content);
    void useDataFiles(const StoreFile& file, MapRules& rules);
    void reportUnreadable(const MapRules& rules);
    void checkSameMaps();
    void checkKinds();
    void checkExtentSizes();
    void checkSharedExtents();
    std::optional<std::uint32_t> tableExtentSize(const std::string& path);

    Context& context_;
    const CheckOptions& options_;
    ChosenFiles files_;
    Report& report_;
    std::vector<StoreFile> sameMaps_;  ///< maps that several LUNs have
    bool anyFile_ = false;             ///< something lies there
    CommonValues commonValues_;
    KindTypes kindTypes_;
    SharedExtents sharedExtents_;
    std::set<std::string> checked_;                               ///< paths on the target
    std::set<std::string> foldersWithoutVolume_;                  ///< with map files
    std::map<std::uint32_t, DataFiles> dataFiles_;                ///< by volume
    std::set<std::string> unreadable_;                            ///< data files that have been reported
    std::map<std::string, std::optional<std::uint32_t>> tables_;  ///< extent sizes of table files that could be read
};

}  // namespace inspection
