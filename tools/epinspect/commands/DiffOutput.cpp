#include "commands/DiffOutput.h"

#include <etc/ISCSIQuorinStringTool.h>

#include "commands/HeaderOutput.h"
#include "commands/MapOutput.h"
#include "frame/Output.h"

namespace epinspect {

namespace {

/// What a difference is called in the listing and in JSON.
struct DifferenceName {
    const char* text;
    const char* json;
};

DifferenceName nameOf(Difference difference) {
    switch (difference) {
        case Difference::onlyFirst:
            return {"only in the first", "only-first"};
        case Difference::onlySecond:
            return {"only in the second", "only-second"};
        case Difference::moved:
            return {"moved", "moved"};
        default:
            return {"flags changed", "flags"};
    }
}

/// One side of a difference. Of entries that are no run it shows the first, with a mark after it.
void writeSide(LineBuffer& line, const DiffRun::Side& side, std::uint64_t count) {
    writeEntries(line, *side.entry, side.isRun ? count : 1);
    if (!side.isRun) line.add(" ...");
}

template <std::size_t keySize>
void writeSide(Json& json, const char (&name)[keySize], const DiffRun::Side& side) {
    if (!side.entry) {
        json.null(name);
        return;
    }
    writeMembers(json.beginObject(name), *side.entry);
    json.endObject();
}

Json& writeOther(Json& json, const DiffName& other) {
    json.path("otherFile", other.file);
    return other.lids.empty() ? json : json.number("otherLid", other.lids.front());
}

/// The lines of a field: of a list one for each element that differs.
std::string linesOf(const FieldDifference& difference, const std::string& prefix) {
    const auto& [a, b] = difference;
    if (a.form != HeaderField::Form::texts) {
        return prefix + a.name + ": " + textOf(a) + " -> " + textOf(b) + "\n";
    }
    std::string lines;
    for (std::size_t i = 0; i < std::max(a.texts.size(), b.texts.size()); ++i) {
        const auto element = [i](const HeaderField& field) { return i < field.texts.size() ? field.texts[i] : "none"; };
        if (element(a) == element(b)) continue;
        lines += prefix + a.name + " #" + std::to_string(i + 1) + ": " + element(a) + " -> " + element(b) + "\n";
    }
    return lines;
}

std::string fieldsText(std::uint64_t fields) {
    if (fields == 0) return "no field differs";
    return counted(fields, "field differs", "fields differ");
}

std::string entriesText(const DiffSummary& summary) {
    const std::string entries = counted(summary.entries, "entry", "entries") + ": ";
    if (summary.same() == summary.entries) return entries + "no difference";
    return entries + std::to_string(summary.same()) + " same, " + std::to_string(summary.onlyFirst) +
           " only in the first, " + std::to_string(summary.onlySecond) + " only in the second, " +
           std::to_string(summary.moved) + " moved, " + std::to_string(summary.flags) + " with other flags";
}

}  // namespace

DiffOutput::DiffOutput(Session& session, const DiffName& file, DiffName otherFile, const std::string& path)
    : session_(session),
      otherFile_(std::move(otherFile)),
      prefix_(path.empty() ? path : forReader(path) + ": "),
      json_(file.file, file.lids) {}

void DiffOutput::print(const FieldDifference& difference) {
    session_.differences = true;
    if (!session_.json) return epinspect::print(linesOf(difference, prefix_));
    writeOther(json_.begin("field"), otherFile_).text("field", difference.first.name);
    writeValue(json_, "a", difference.first);
    writeValue(json_, "b", difference.second);
    json_.end();
}

void DiffOutput::print(const DiffRun& run) {
    session_.differences = true;
    if (session_.json) return printAsJson(run);
    line_.clear();
    writeRange(line_.add(prefix_), run.first, run.count);
    line_.add(": ", nameOf(run.difference).text, ": ");
    if (run.difference != Difference::onlySecond) writeSide(line_, run.a, run.count);
    if (run.difference == Difference::moved || run.difference == Difference::flags) line_.add(" -> ");
    if (run.difference != Difference::onlyFirst) writeSide(line_, run.b, run.count);
    epinspect::print(line_.add("\n").view());
}

void DiffOutput::printAsJson(const DiffRun& run) {
    writeOther(json_.begin("difference"), otherFile_).number("first", run.first).number("count", run.count);
    json_.text("difference", nameOf(run.difference).json);
    writeSide(json_, "a", run.a);
    writeSide(json_, "b", run.b);
    json_.end();
}

void printOnlyInOne(Session& session, const FilePair& pair) {
    session.differences = true;
    const StoreFile& file = pair.any();
    const DifferenceName name = nameOf(pair.a ? Difference::onlyFirst : Difference::onlySecond);
    if (!session.json) {
        print(forReader(file.path) + ": " + name.text + ": " + file.kind->title + ", " +
              counted(file.size, "byte", "bytes") + "\n");
        return;
    }
    Json json(file.path, lidsOf(file.luns));
    json.begin("storeDifference").null("otherFile");
    json.text("difference", name.json).text("fileKind", file.kind->name).number("size", file.size).end();
}

void printSummary(const Session& session, const DiffName& file, const DiffName& otherFile, const DiffTotals& totals,
                  const DiffScope& scope) {
    if (session.json) {
        Json json(file.file, file.lids);
        writeOther(json.begin("summary"), otherFile).boolean("summary", true);
        if (scope.stores) json.number("files", totals.files);
        json.number("fields", totals.fields)
            .number("same", totals.entries.same())
            .number("onlyFirst", totals.entries.onlyFirst)
            .number("onlySecond", totals.entries.onlySecond)
            .number("moved", totals.entries.moved)
            .number("flags", totals.entries.flags)
            .texts("changed", session.changedFiles())
            .end();
        return;
    }
    std::string text;
    if (scope.stores) {
        text = counted(totals.files, "file", "files") + ": " + std::to_string(totals.onlyFirst) +
               " only in the first, " + std::to_string(totals.onlySecond) + " only in the second; ";
    }
    if (scope.headers) text += fieldsText(totals.fields) + (scope.entries ? "; " : "");
    if (scope.entries) text += entriesText(totals.entries);
    print(text + "\n");
}

}  // namespace epinspect
