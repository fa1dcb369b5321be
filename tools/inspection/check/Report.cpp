#include "check/Report.h"

#include <algorithm>
#include <limits>
#include <set>

namespace inspection {

namespace {

/// Adds the entries of `more` to those of `finding`, which keeps the run that comes first.
void join(Finding& finding, Finding&& more) {
    const std::uint64_t entries = finding.entries->entries + more.entries->entries;
    const std::uint64_t runs = finding.entries->runs + more.entries->runs;
    if (more.entries->first < finding.entries->first) finding = std::move(more);
    finding.entries->entries = entries;
    finding.entries->runs = runs;
}

}  // namespace

void Report::beginFile(const std::string& path, std::optional<std::uint32_t> lid, const ChangeWatch& watch) {
    known_.emplace(path, File{known_.size(), lid, watch});
}

bool Report::hasChanged(const std::string& path) const {
    const auto file = known_.find(path);
    return file != known_.end() && file->second.watch.noticeChange();
}

void Report::add(Finding finding) {
    constexpr std::size_t mostWaiting = 16384;  // a hostile store may have any number of them
    if (waiting_.size() >= mostWaiting) handOut();
    if (finding.entries && (!each_ || finding.alike)) {
        const std::string other = finding.partner ? finding.partner->file : "";
        const auto [group, added] =
            groups_.try_emplace({finding.file, finding.rule, other, finding.dataFile}, waiting_.size());
        if (!added) return join(waiting_[group->second], std::move(finding));
    }
    waiting_.push_back(std::move(finding));
}

void Report::handOut() {
    askForChanges();
    std::stable_sort(waiting_.begin(), waiting_.end(),
                     [this](const Finding& one, const Finding& other) { return rankOf(one) < rankOf(other); });
    for (Finding& finding : waiting_) {
        complete(finding);
        ++findings_[finding.rule];
        take_(finding);
    }
    waiting_.clear();
    groups_.clear();
}

/// Lets the context know which of the files that findings are about have changed.
void Report::askForChanges() const {
    std::set<std::string> paths;
    for (const Finding& finding : waiting_) {
        paths.insert(finding.file);
        if (finding.partner) paths.insert(finding.partner->file);
    }
    for (const std::string& path : paths) hasChanged(path);
}

std::optional<std::uint32_t> Report::lidOf(const std::string& path) const {
    const auto file = known_.find(path);
    return file != known_.end() ? file->second.lid : std::nullopt;
}

/// Adds what follows from the files that the finding is about.
void Report::complete(Finding& finding) const {
    finding.passing = context_.hasChanged(finding.file) || context_.hasChanged(finding.dataFilePath);
    if (!finding.lid) finding.lid = lidOf(finding.file);
    if (!finding.partner) return;
    finding.passing = finding.passing || context_.hasChanged(finding.partner->file);
    if (!finding.otherLid) finding.otherLid = lidOf(finding.partner->file);
}

std::pair<std::size_t, std::size_t> Report::rankOf(const Finding& finding) const {
    const auto rank = [this](const std::string& path) {
        const auto file = known_.find(path);
        return file != known_.end() ? file->second.rank : std::numeric_limits<std::size_t>::max();
    };
    return {rank(finding.file), finding.partner ? rank(finding.partner->file) : 0};
}

void Report::addSnapshot(Snapshot snapshot) {
    snapshot.lid = lidOf(snapshot.file);
    snapshot.parentLid = lidOf(snapshot.parent);
    snapshots_.push_back(std::move(snapshot));
}

void Report::notCompared(const std::string& what, const std::string& file) {
    Files& files = notCompared_[what];
    if (files.count++ == 0) files.first = file;
}

std::vector<std::string> Report::gaps() const {
    std::vector<std::string> texts;
    for (const auto& [what, files] : notCompared_) {
        const std::string file = files.first.empty() ? "" : ": " + files.first;
        texts.push_back(what + file + (files.count > 1 ? " and " + std::to_string(files.count - 1) + " more" : ""));
    }
    return texts;
}

}  // namespace inspection
