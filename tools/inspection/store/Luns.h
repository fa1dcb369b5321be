// The configuration of LUNs, as the platform's library gives it.
#pragma once

#include <ISCSILUNConfInfo.h>

#include <cstdint>
#include <functional>
#include <optional>
#include <string>
#include <unordered_map>
#include <vector>

#include "store/Context.h"

namespace inspection {

/// LUN ids to be tried, `first` and `last` included.
struct Lids {
    std::uint64_t first;
    std::uint64_t last;
    bool asked = true;  ///< the user asked for these: that there is no LUN among them is a failure
};

/// The ids that are tried unless the user names others.
constexpr Lids usualLids = {0, 255, false};

/// How messages name LUN ids: "LUN 1", "LUN 0-255". And in the middle of a sentence: "id 1", "an id from 0 to 255".
Subject subjectOf(const Lids& lids);
std::string idsText(const Lids& lids);

/// A LUN, and where its map file lies on the target.
struct Lun {
    ISCSI::TOOL::ISCSILUNConfInfo record;
    std::string mapPath;
};

/// Their ids, in the same order.
std::vector<std::uint32_t> lidsOf(const std::vector<const Lun*>& luns);

/// Which LUNs have a map file: by its path on the target, in plain form.
class LunsByMap {
public:
    void add(const std::string& path, const Lun& lun);

    /// In the order in which they were added.
    const std::vector<const Lun*>& at(const std::string& path) const;

private:
    std::unordered_map<std::string, std::vector<const Lun*>> luns_;
};

/// Loads the LUN `lid`. Returns 0 or the code of the platform's library; errno is then the system's reason.
int loadLun(Context& context, std::uint32_t lid, Lun& lun);

/// What went wrong while LUN ids were tried; none of it is reported yet.
struct LunTrial {
    std::vector<Failure> failures;  ///< of LUNs that exist, it seems, lowest id first, and of the trial as a whole
    std::optional<Failure> none;    ///< there is no LUN and no other failure: what the first id got
};

/// Calls each() for the LUNs whose ids are in `lids`, lowest id first. Every id is loaded once.
LunTrial tryLuns(Context& context, const Lids& lids, const std::function<void(const Lun&)>& each);

/// Whether there is no LUN because the configuration cannot be read; an empty one is no failure, nor is none at all
/// unless the user has named one.
bool isUnreadable(const Failure& none);

/// The same as tryLuns(), and reports what went wrong. That there is no LUN is a failure where the user asked for these
/// ids or the configuration cannot be read, else a remark.
void forEachLun(Context& context, const Lids& lids, const std::function<void(const Lun&)>& each);

}  // namespace inspection
