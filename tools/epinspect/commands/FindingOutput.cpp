#include "commands/FindingOutput.h"

#include "commands/MapOutput.h"
#include "frame/Output.h"
#include "store/FileNames.h"

namespace epinspect {

namespace {

std::string shown(const Value& value) {
    if (value.form == Value::Form::text) return value.words;
    LineBuffer text;
    if (value.form == Value::Form::number) {
        text.decimal(value.bits);
    } else {
        text.hexadecimal(value.bits);
    }
    return std::string(text.view());
}

template <std::size_t keySize>
void write(Json& json, const char (&name)[keySize], const Value& value) {
    switch (value.form) {
        case Value::Form::number:
            json.number(name, value.bits);
            break;
        case Value::Form::hexadecimal:
            json.hexadecimal(name, value.bits);
            break;
        case Value::Form::text:
            json.text(name, value.words);
            break;
    }
}

/// "entry 3" or "entries 3-5".
std::string rangeText(const char* one, const char* several, std::uint64_t first, std::uint64_t count) {
    LineBuffer text;
    writeRange(text.add(count == 1 ? one : several), first, count);
    return std::string(text.view());
}

std::string entriesText(std::uint64_t first, std::uint64_t count) {
    return rangeText("entry ", "entries ", first, count);
}

std::string extentsText(std::uint64_t first, std::uint64_t count) {
    return rangeText("extent ", "extents ", first, count);
}

/// "entries 3-5", or "7 entries in 2 runs, first entries 3-5".
std::string whichText(const Finding::Entries& entries) {
    if (entries.runs == 1) return entriesText(entries.first, entries.count);
    return std::to_string(entries.entries) + " entries in " + std::to_string(entries.runs) + " runs, first " +
           entriesText(entries.first, entries.count);
}

/// The extent of the first of several entries, which need not be a run.
std::string firstExtentText(const Finding::Entries& entries) {
    return extentsText(entries.entry.extentAddress, 1) + (entries.entries == 1 ? "" : " and others");
}

std::string lunText(std::uint32_t lid) { return "LUN " + std::to_string(lid); }

std::string kindText(const Finding& finding) {
    const KindDoubt& doubt = *finding.kinds;
    const std::string type = "type " + std::to_string(doubt.type);
    const std::string named = std::string(", but named like a ") + doubt.byName->title;
    if (!finding.partner)
        return type + (doubt.byType == nullptr ? "" : std::string(", a ") + doubt.byType->title) + named;
    const std::string other = finding.partner->file;
    if (doubt.byType != nullptr) return type + ", which the " + doubt.byType->title + " " + other + " has too" + named;
    return type + ", the " + doubt.byName->title + " " + other + " has " + shown(finding.found);
}

std::string dataStartText(const DataStartDoubt& doubt) {
    return doubt.insideHeader ? ", inside the header block of " + std::to_string(doubt.limit) + " bytes"
                              : ", past the end of the file, which has " + std::to_string(doubt.limit) + " bytes";
}

std::string partialEntryText(const Finding& finding) {
    return "the file of " + shown(finding.stored) + " bytes ends inside entry " +
           std::to_string(finding.partial->index) + ", " + std::to_string(finding.partial->bytes) + " of its " +
           std::to_string(entrySize) + " bytes are there";
}

/// "entries 4-5 of LUN 2, PATH,"; of one of several runs.
std::string partnerText(const Finding& finding) {
    const Finding::Entries& entries = *finding.entries;
    const std::string which = entriesText(finding.partner->first, entries.count) + " of ";
    if (finding.partner->file == finding.file) return which + "this map";
    return which +
           (finding.otherLid ? lunText(*finding.otherLid) + ", " + finding.partner->file + "," : finding.partner->file);
}

std::string sharedText(const Finding& finding) {
    const Finding::Entries& entries = *finding.entries;
    return "pool " + std::to_string(entries.entry.poolNumber) + ", " +
           extentsText(entries.entry.extentAddress, entries.count) + ", used by " + partnerText(finding) + " too" +
           (finding.alike ? "; all that they share is alike, as in a snapshot" : "");
}

/// The part of a message that describes the entries.
std::string entriesMessage(const Finding& finding) {
    const Finding::Entries& entries = *finding.entries;
    const std::string stored = shown(finding.stored);
    switch (finding.rule) {
        case Rule::unmappedBits:
            return entries.entries == 1 ? "unmapped, but holds " + stored
                                        : "unmapped, but not zero; the first holds " + stored;
        case Rule::addressBits:
            return (entries.entries == 1 ? "" : "the first holds ") + stored + ", of which bits 48 to 51 are " +
                   shown(finding.found) + ": they count in extent address and pool number";
        case Rule::missingDataFile:
            return firstExtentText(entries) + ", but there is " + shown(finding.found);
        case Rule::beyondDataFile:
            return firstExtentText(entries) + ", past the end of " + dataFileName(finding.dataFile) + ", which holds " +
                   counted(finding.found.bits, "extent", "extents");
        default:
            return sharedText(finding);
    }
}

std::string missingFileText(const Finding& finding) {
    if (!finding.lid) return shown(finding.found);
    const std::string others = counted(finding.moreLuns, "other", "others");
    return shown(finding.found) + ", but this LUN " +
           (finding.moreLuns == 0 ? "needs it" : "and " + others + " need it");
}

/// What is stored, what was found.
std::string messageOf(const Finding& finding) {
    if (finding.entries) return whichText(*finding.entries) + ": " + entriesMessage(finding);
    const std::string stored = shown(finding.stored);
    const std::string found = shown(finding.found);
    switch (finding.rule) {
        case Rule::kind:
            return kindText(finding);
        case Rule::dataStart:
            return stored + dataStartText(*finding.dataStart);
        case Rule::magic:
        case Rule::version:
            return stored + ", most files have " + found;
        case Rule::totalCount:
            return stored + " stored, " + found + " entries found";
        case Rule::mappedCount:
            return stored + " stored, " + found + " mapped entries found";
        case Rule::syncCount:
            return stored + " stored, " + found + " synced entries found";
        case Rule::poolCount:
            return stored + " stored, SEG[0] holds at most " + found;
        case Rule::partialEntry:
            return partialEntryText(finding);
        case Rule::serialNumber:
            return stored + " stored, the name says " + found;
        case Rule::lunSize:
            return std::to_string(finding.totalCount) + " entries of " + std::to_string(finding.extentSize) +
                   " bytes are " + stored + " bytes, the LUN has " + found;
        case Rule::extentSize:
            return stored + " stored, the LUN has " + found;
        case Rule::sameMap:
            return found + " has this map file too";
        default:
            return missingFileText(finding);
    }
}

std::string lineOf(const Finding& finding) {
    return finding.file + ": " + (finding.lid ? lunText(*finding.lid) + ": " : "") + nameOf(finding.rule) + ": " +
           messageOf(finding) + (finding.passing ? " (possibly passing: the file has changed while it was read)" : "");
}

/// "PATH: LUN 3: shares 5 entries with its parent LUN 1, PATH".
std::string lineOf(const Snapshot& snapshot) {
    return snapshot.file + ": " + (snapshot.lid ? lunText(*snapshot.lid) + ": " : "") + "shares " +
           counted(snapshot.entries, "entry", "entries") + " with its parent " +
           (snapshot.parentLid ? lunText(*snapshot.parentLid) + ", " : "") + snapshot.parent;
}

}  // namespace

void FindingOutput::print(const Finding& finding) {
    session_.differences = true;
    if (session_.json) {
        printAsJson(finding);
    } else {
        epinspect::print(forReader(lineOf(finding)) + "\n");
    }
}

void FindingOutput::printAsJson(const Finding& finding) {
    if (!json_ || jsonFile_ != finding.file) {
        json_.emplace(finding.file);
        jsonFile_ = finding.file;
    }
    json_->begin("finding").text("rule", nameOf(finding.rule));
    write(*json_, "stored", finding.stored);
    write(*json_, "found", finding.found);
    if (finding.lid) json_->number("lid", *finding.lid);
    if (finding.otherLid) json_->number("otherLid", *finding.otherLid);
    if (const auto& entries = finding.entries) {
        json_->number("entries", entries->entries).number("runs", entries->runs);
        json_->number("first", entries->first).number("count", entries->count);
    }
    if (finding.partner) json_->path("otherFile", finding.partner->file);
    if (finding.partner && finding.entries) json_->number("otherFirst", finding.partner->first);
    if (finding.alike) json_->boolean("snapshot", true);
    if (finding.passing) json_->boolean("passing", true);
    json_->text("message", lineOf(finding)).end();
}

void FindingOutput::printSummary(const Report& report) const {
    std::uint64_t findings = 0;
    std::string rules;
    for (const auto& [rule, count] : report.findings()) {
        rules += (findings == 0 ? ": " : ", ") + std::to_string(count) + " " + nameOf(rule);
        findings += count;
    }
    if (session_.json) return printSummaryAsJson(report, findings);
    epinspect::print(counted(report.files(), "file", "files") + ", " + counted(report.entries(), "entry", "entries") +
                     ", " + counted(findings, "finding", "findings") + rules + "\n");
    for (const Snapshot& snapshot : report.snapshots()) {
        epinspect::print("Snapshot: " + forReader(lineOf(snapshot)) + "\n");
    }
    for (const std::string& text : report.gaps()) epinspect::print("Not compared: " + forReader(text) + "\n");
}

void FindingOutput::printSummaryAsJson(const Report& report, std::uint64_t findings) const {
    Json json("");
    json.begin("summary")
        .boolean("summary", true)
        .number("files", report.files())
        .number("entries", report.entries())
        .number("findings", findings)
        .beginObject("rules");
    for (const auto& [rule, count] : report.findings()) json.number(std::string_view(nameOf(rule)), count);
    json.endObject().texts("notCompared", report.gaps()).texts("changed", session_.changedFiles());
    json.beginList("snapshots");
    for (const Snapshot& snapshot : report.snapshots()) {
        json.beginObject().path("file", snapshot.file).path("parent", snapshot.parent);
        if (snapshot.lid) json.number("lid", *snapshot.lid);
        if (snapshot.parentLid) json.number("parentLid", *snapshot.parentLid);
        json.number("entries", snapshot.entries).endObject();
    }
    json.endList().end();
}

}  // namespace epinspect
