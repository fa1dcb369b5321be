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

/// The extent of the first of several entries, which need not be a run.
std::string firstExtentText(const Finding::Entries& entries) {
    return extentsText(entries.entry.extentAddress, 1) + (entries.count == 1 ? "" : " in the first");
}

std::string kindText(const KindDoubt& doubt) {
    return "type " + std::to_string(doubt.type) +
           (doubt.byType == nullptr ? "" : std::string(", a ") + doubt.byType->title) + ", but named like a " +
           doubt.byName->title;
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

std::string sharedText(const Finding& finding) {
    const Finding::Entries& entries = *finding.entries;
    const Finding::Partner& partner = *finding.partner;
    return "pool " + std::to_string(entries.entry.poolNumber) + ", " +
           extentsText(entries.entry.extentAddress, entries.count) + ", used by " +
           entriesText(partner.first, entries.count) + " of " +
           (partner.file == finding.file ? "this map" : partner.file) + " too";
}

/// What a finding says of its entries.
std::string entriesMessage(const Finding& finding) {
    const Finding::Entries& entries = *finding.entries;
    const std::string stored = shown(finding.stored);
    switch (finding.rule) {
        case Rule::unmappedBits:
            return "unmapped, but " + std::string(entries.count == 1 ? "" : "the first ") + "holds " + stored;
        case Rule::addressBits:
            return stored + (entries.count == 1 ? "" : " in the first") + ", of which bits 48 to 51 are " +
                   shown(finding.found) + ": they count in extent address and pool number";
        case Rule::missingDataFile:
            return firstExtentText(entries) + ", for which there is " + shown(finding.found);
        case Rule::beyondDataFile:
            return firstExtentText(entries) + ", past the end of " + dataFileName(finding.dataFile) + ", which holds " +
                   counted(finding.found.bits, "extent", "extents");
        default:
            return sharedText(finding);
    }
}

/// What is stored, what was found.
std::string messageOf(const Finding& finding) {
    if (finding.entries) {
        return entriesText(finding.entries->first, finding.entries->count) + ": " + entriesMessage(finding);
    }
    const std::string stored = shown(finding.stored);
    const std::string found = shown(finding.found);
    const std::string lun = finding.lid ? "LUN " + std::to_string(*finding.lid) : "";
    switch (finding.rule) {
        case Rule::kind:
            return kindText(*finding.kinds);
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
                   " bytes are " + stored + " bytes, " + lun + " has " + found;
        case Rule::extentSize:
            return stored + " stored, " + lun + " has " + found;
        default:
            return lun + " is configured, but has no map file";
    }
}

std::string lineOf(const Finding& finding) {
    return finding.file + ": " + nameOf(finding.rule) + ": " + messageOf(finding);
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
    if (finding.entries) json_->number("first", finding.entries->first).number("count", finding.entries->count);
    if (finding.partner) {
        json_->path("otherFile", finding.partner->file).number("otherFirst", finding.partner->first);
    }
    if (finding.lid) json_->number("lid", *finding.lid);
    json_->text("message", lineOf(finding)).end();
}

void FindingOutput::printSummary(const Report& report) const {
    if (session_.json) {
        Json json("");
        json.begin("summary")
            .boolean("summary", true)
            .number("files", report.files())
            .number("entries", report.entries())
            .number("findings", report.findings())
            .texts("notCompared", report.gaps())
            .texts("changed", session_.changedFiles())
            .end();
        return;
    }
    epinspect::print(counted(report.files(), "file", "files") + ", " + counted(report.entries(), "entry", "entries") +
                     ", " + counted(report.findings(), "finding", "findings") + "\n");
    for (const std::string& text : report.gaps()) epinspect::print("Not compared: " + forReader(text) + "\n");
}

}  // namespace epinspect
