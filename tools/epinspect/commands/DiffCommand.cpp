// epinspect diff: what differs between two files of a kind, or between two stores.
#include <filesystem>
#include <memory>

#include "commands/Commands.h"
#include "commands/DiffOutput.h"
#include "commands/MapArguments.h"
#include "store/FileDiff.h"
#include "store/Store.h"

namespace epinspect {

namespace {

struct DiffOptions {
    LunName a, b;
    bool headersOnly = false;
    bool entriesOnly = false;
};

/// One of two stores, below a folder of its own. Failures there are reported with that folder.
class SideOfDiff : public Context {
public:
    SideOfDiff(Session& session, const std::string& folder) : session_(session), folder_(folder) {
        const std::error_code error = setRoot(folder);
        if (error) throw UsageError{"'" + folder + "': " + error.message()};
        if (damagedCollection) session.failed(*damagedCollection);
        while (folder_.size() > 1 && folder_.back() == '/') folder_.pop_back();
    }

    void remark(const std::string& subject, const std::string& text) override {
        session_.remark(folder_ + subject, text);
    }

    void progress(const char* things, std::uint64_t done, std::uint64_t total) override {
        session_.progress(things, done, total);
    }

    void trying(bool begins) override { session_.trying(begins); }
    void changed(const std::string& name) override { session_.changed(folder_ + name); }
    std::vector<std::string> takeTrialLog() override { return session_.takeTrialLog(); }

protected:
    void report(const Failure& failure) override {
        Failure here = failure;
        if (!here.subject.file.empty()) here.subject.file = folder_ + here.subject.file;
        session_.failed(here);
    }

private:
    Session& session_;
    std::string folder_;
};

/// A file on one side, as it is called there.
struct DiffSide {
    Context& context;
    const std::string& name;
    NamedBy by;
};

/// Compares two files and counts what differs. What cannot be read is reported.
class FilesDiff {
public:
    FilesDiff(const DiffScope& scope, DiffTotals& totals) : scope_(scope), totals_(totals) {}

    /// Returns whether both files could be compared to their end. Without `isMap` only headers were.
    bool compare(const DiffSide& a, const DiffSide& b, DiffOutput& output, bool& isMap) {
        isMap = scope_.entries && !scope_.headers;
        if (scope_.headers) {
            const OpenedHeader headers[] = {openHeader(a.context, a.name, a.by), openHeader(b.context, b.name, b.by)};
            if (!headers[0].file || !headers[1].file) return false;
            if (!areAlike(headers[0], headers[1], a, b)) return false;
            for (const FieldDifference& difference : fieldDifferencesOf(*headers[0].file, *headers[1].file)) {
                ++totals_.fields;
                output.print(difference);
            }
            isMap = headers[0].kind->type == ISCSI::TOOL::EP_FILE_TYPE_MAP && scope_.entries;
        }
        return !isMap || compareMaps(a, b, output);
    }

private:
    bool areAlike(const OpenedHeader& one, const OpenedHeader& other, const DiffSide& a, const DiffSide& b) {
        if (one.kind == other.kind) return true;
        a.context.fail({a.name, ""},
                       std::string("is a ") + one.kind->title + ", but " + b.name + " is a " + other.kind->title +
                           ": only files of one kind can be compared",
                       ISCSI::TOOL::EP_ERR_WRONG_FILE_TYPE);
        return false;
    }

    bool compareMaps(const DiffSide& a, const DiffSide& b, DiffOutput& output) {
        ComparedMap maps[] = {{a.context, a.name, openMap(a.context, a.name, a.by)},
                              {b.context, b.name, openMap(b.context, b.name, b.by)}};
        if (!maps[0].map.file || !maps[1].map.file) return false;
        totals_.entries.entries += std::max(maps[0].map.entries, maps[1].map.entries);
        const bool complete = compareEntries(maps[0], maps[1], [&](const DiffRun& run) {
            totals_.entries.add(run);
            output.print(run);
        });
        for (const ComparedMap& compared : maps) compared.map.watch->noticeChange();
        return complete;
    }

    const DiffScope& scope_;
    DiffTotals& totals_;
};

void compareFiles(const DiffOptions& options, DiffScope scope, Session& session) {
    const std::optional<NamedMap> a = findMap(session, options.a);
    const std::optional<NamedMap> b = findMap(session, options.b);
    if (!a || !b) return;
    const DiffName names[] = {{a->file, a->lids()}, {b->file, b->lids()}};
    DiffTotals totals;
    DiffOutput output(session, names[0], names[1], "");
    bool areMaps = false;
    const DiffSide sides[] = {{session, a->file, a->by}, {session, b->file, b->by}};
    if (!FilesDiff(scope, totals).compare(sides[0], sides[1], output, areMaps)) return;
    scope.entries = areMaps;
    printSummary(session, names[0], names[1], totals, scope);
}

/// Data files are compared by header and size; so are all others but maps, whose entries are compared.
void compareSizes(const FilePair& pair, DiffOutput& output, DiffTotals& totals) {
    if (pair.a->size == pair.b->size || pair.a->kind->type == ISCSI::TOOL::EP_FILE_TYPE_MAP) return;
    ++totals.fields;
    output.print(FieldDifference({"size", HeaderField::Form::number, pair.a->size},
                                 {"size", HeaderField::Form::number, pair.b->size}));
}

void compareStores(const DiffOptions& options, DiffScope scope, Session& session) {
    scope.stores = true;
    SideOfDiff sides[] = {{session, options.a.file}, {session, options.b.file}};
    DiffTotals totals;
    FilesDiff files(scope, totals);
    Store stores[] = {Store(sides[0], usualLids), Store(sides[1], usualLids)};
    for (const FilePair& pair : pairFiles(stores[0], stores[1])) {
        ++totals.files;
        if (!pair.a || !pair.b) {
            ++(pair.a ? totals.onlyFirst : totals.onlySecond);
            printOnlyInOne(session, pair);
            continue;
        }
        const std::string& path = pair.a->path;
        DiffOutput output(session, {path, lidsOf(pair.a->luns)}, {path, lidsOf(pair.b->luns)}, path);
        if (scope.headers) compareSizes(pair, output, totals);
        bool isMap = pair.a->kind->type == ISCSI::TOOL::EP_FILE_TYPE_MAP;
        const DiffSide a = {sides[0], path, NamedBy::target};
        const DiffSide b = {sides[1], path, NamedBy::target};
        if (scope.headers || isMap) files.compare(a, b, output, isMap);
    }
    printSummary(session, {options.a.file}, {options.b.file}, totals, scope);
}

void run(const DiffOptions& options, Session& session) {
    DiffScope scope;
    scope.headers = !options.entriesOnly;
    scope.entries = !options.headersOnly;
    std::error_code error;
    const bool folders[] = {std::filesystem::is_directory(options.a.file, error),
                            std::filesystem::is_directory(options.b.file, error)};
    if (folders[0] != folders[1]) throw UsageError{"A and B must both be files, or both be folders"};
    if (!folders[0]) return compareFiles(options, scope, session);
    if (session.root.isFolder()) throw UsageError{"--root: not with two folders, each of which is a root itself"};
    compareStores(options, scope, session);
}

}  // namespace

void addDiff(Command& parent, Session& session) {
    const auto options = std::make_shared<DiffOptions>();
    parent.add("diff", "Show what differs between two files, or between two stores")
        .argument("A", "An EP file, a LUN id for its map, or the folder of a store", options->a, parseMap)
        .argument("B", "What to compare it with: a file of the same kind, or another folder", options->b, parseMap)
        .flag("--headers", "Compare the fields of header blocks alone", options->headersOnly)
        .flag("--entries", "Compare the entries of maps alone", options->entriesOnly)
        .flag("--json", "One JSON object per difference, then a summary", session.json)
        .exclusive("--headers", "--entries")
        .action([options, &session] { run(*options, session); });
}

}  // namespace epinspect
