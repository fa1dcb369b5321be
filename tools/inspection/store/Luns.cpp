#include "store/Luns.h"

#include <ISCSIEPFileMAP.h>

#include <algorithm>
#include <cerrno>
#include <map>
#include <set>
#include <utility>

#include "store/FileNames.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

/// How an id could not be loaded.
struct Miss {
    std::uint64_t lid;
    int error;
    int reason;
    std::vector<std::string> log;

    /// Whether the configuration is damaged: that reason stands for nothing else.
    bool isDamage() const { return reason == EBADMSG; }
};

/// Nothing when the LUN could be loaded.
std::optional<Miss> tryLun(Context& context, std::uint64_t lid, Lun& lun) {
    const Trial trial(context);
    const int error = loadLun(context, static_cast<std::uint32_t>(lid), lun);
    const int reason = errno;
    if (error == 0) return std::nullopt;
    return Miss{lid, error, reason, context.takeTrialLog()};
}

Failure failureOf(const Miss& miss) { return {subjectOf({miss.lid, miss.lid}), miss.error, miss.reason, {}, miss.log}; }

/// ": " and the platform's library's text for its code; empty where it has none.
std::string textOf(int error) {
    const std::string text = tool::ISCSILUNConfInfo::getErrorText(error);
    return text.empty() ? text : ": " + text;
}

/// Finds out how the platform's library says "no such LUN", which is not documented: as it does for ids that no target
/// uses. These lie apart, because it may refuse large ones in another way. They are asked again and again while others
/// are tried: an answer that changes says that the configuration cannot be relied on meanwhile.
class UnusedIds {
public:
    explicit UnusedIds(Context& context) : context_(context) {}

    void ask() {
        Lun lun;
        for (const std::uint64_t lid : {131063U, 1048571U, 16777199U, 268435399U, 2147483629U, 4294967279U}) {
            std::optional<Miss> miss = tryLun(context_, lid, lun);
            if (!miss) continue;
            codes_.insert(miss->error);
            if (miss->isDamage()) damage_ = miss;
            const auto [before, isFirst] = answers_.emplace(lid, *miss);
            if (!isFirst && before->second.error != miss->error && !changed_) changed_ = std::move(miss);
        }
    }

    bool haveCode(int error) const { return codes_.count(error) > 0; }

    /// An answer that differs from the one before.
    const std::optional<Miss>& changed() const { return changed_; }

    /// An answer that says that any number of LUNs may be lost.
    const std::optional<Miss>& damage() const { return damage_; }

private:
    Context& context_;
    std::set<int> codes_;
    std::map<std::uint64_t, Miss> answers_;  ///< the first ones, by id
    std::optional<Miss> changed_, damage_;
};

/// The code that more than half of the ids got, where they are many enough to rely on that, and not for damage.
std::optional<int> usualCode(const std::vector<Miss>& misses, std::uint64_t tried) {
    constexpr std::uint64_t enough = 256;
    std::map<int, std::uint64_t> counts;
    if (tried < enough) return std::nullopt;
    for (const Miss& miss : misses) {
        if (!miss.isDamage() && ++counts[miss.error] > tried / 2) return miss.error;
    }
    return std::nullopt;
}

}  // namespace

Subject subjectOf(const Lids& lids) {
    const std::string first = std::to_string(lids.first);
    if (lids.first == lids.last) return {"", "LUN " + first, static_cast<std::uint32_t>(lids.first)};
    return {"", "LUN " + first + "-" + std::to_string(lids.last)};
}

std::string idsText(const Lids& lids) {
    const std::string first = std::to_string(lids.first);
    return lids.first == lids.last ? "id " + first : "an id from " + first + " to " + std::to_string(lids.last);
}

std::vector<std::uint32_t> lidsOf(const std::vector<const Lun*>& luns) {
    std::vector<std::uint32_t> lids;
    lids.reserve(luns.size());
    for (const Lun* lun : luns) lids.push_back(lun->record.lid);
    return lids;
}

void LunsByMap::add(const std::string& path, const Lun& lun) { luns_[path].push_back(&lun); }

const std::vector<const Lun*>& LunsByMap::at(const std::string& path) const {
    static const std::vector<const Lun*> none;
    const auto found = luns_.find(path);
    return found != luns_.end() ? found->second : none;
}

int loadLun(Context& context, std::uint32_t lid, Lun& lun) {
    context.prepareLuns();
    lun.record = tool::ISCSILUNConfInfo(lid);
    const int error = lun.record.loadFromConfig();
    return error != 0 ? error : tool::ISCSIEPFileMAP().getMAPFilePath(lid, lun.mapPath);
}

LunTrial tryLuns(Context& context, const Lids& lids, const std::function<void(const Lun&)>& each) {
    constexpr std::uint64_t askAfter = 64;
    const std::uint64_t count = lids.last - lids.first + 1;
    UnusedIds unused(context);
    unused.ask();
    std::optional<Miss> first;
    std::vector<Miss> misses;
    bool met = false;
    Lun lun;
    for (std::uint64_t id = lids.first; id <= lids.last; ++id) {
        std::optional<Miss> miss = tryLun(context, id, lun);
        if (!miss) {
            if (!met) unused.ask();  // an answer that does not change with the first LUN stands for all of them
            met = true;
            each(lun);
        } else {
            if (!first) first = miss;
            if (!unused.haveCode(miss->error)) misses.push_back(std::move(*miss));
        }
        const std::uint64_t done = id - lids.first + 1;
        if (done % askAfter == 0) unused.ask();
        context.progress("LUN ids", done, count);
        if (context.interrupted()) return {};
    }
    unused.ask();
    const std::optional<int> usual = usualCode(misses, count);
    LunTrial trial;
    for (const Miss& miss : misses) {
        if (miss.error != usual && !unused.haveCode(miss.error)) trial.failures.push_back(failureOf(miss));
    }
    const auto addDoubt = [&](const Miss& miss, const std::string& why) {
        trial.failures.push_back(failureOf(miss));
        trial.failures.back().subject = subjectOf(lids);
        trial.failures.back().what = "some may be missing" + why + textOf(miss.error);
    };
    if (const auto& changed = unused.changed()) {
        addDoubt(*changed, ", the answer for ids without a LUN has changed meanwhile");
    } else if (const auto& damage = unused.damage(); damage && first && (met || !trial.failures.empty())) {
        addDoubt(*damage, "");
    }
    if (met || !trial.failures.empty()) return trial;
    trial.none = failureOf(*first);
    trial.none->subject = subjectOf(lids);
    if (count > 1) trial.none->what = "none is known" + textOf(first->error);
    return trial;
}

bool isUnreadable(const Failure& none) {
    const bool isAbsent = none.reason == ENOENT || none.reason == ENOTDIR;
    return none.reason != 0 && (!isAbsent || Context::isListNamed());
}

LunTrial forEachLun(Context& context, const Lids& lids, const std::function<void(const Lun&)>& each) {
    LunTrial trial = tryLuns(context, lids, each);
    for (const Failure& failure : trial.failures) context.failed(failure);
    if (trial.none && (lids.asked || isUnreadable(*trial.none))) {
        context.failed(*trial.none);
    } else if (trial.none) {
        context.remark(textOf(trial.none->subject), whatOf(*trial.none));
    }
    return trial;
}

}  // namespace inspection
