#include "check/Report.h"

#include "Output.h"
#include "map/MapOutput.h"

namespace epinspect {

namespace {

std::string lineOf(const Finding& finding) { return finding.file + ": " + finding.rule + ": " + finding.message; }

std::string rangeOf(const char* things, std::uint64_t first, std::uint64_t count) {
    Text text;
    writeRange(text.add(things), first, count);
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

}  // namespace

std::string Value::shown() const {
    if (form == Form::text) return words;
    Text text;
    if (form == Form::number) {
        text.decimal(bits);
    } else {
        text.hexadecimal(bits);
    }
    return std::string(text.view());
}

std::string entriesText(std::uint64_t first, std::uint64_t count) {
    return rangeOf(count == 1 ? "entry " : "entries ", first, count);
}

std::string extentsText(std::uint64_t first, std::uint64_t count) {
    return rangeOf(count == 1 ? "extent " : "extents ", first, count);
}

void Report::add(const Finding& finding) {
    session_.differences = true;
    ++findings_;
    if (session_.json) {
        printAsJson(finding);
    } else {
        epinspect::print(forReader(lineOf(finding)) + "\n");
    }
}

void Report::printAsJson(const Finding& finding) {
    if (!json_ || jsonFile_ != finding.file) {
        json_.emplace(finding.file);
        jsonFile_ = finding.file;
    }
    json_->begin("finding").text("rule", finding.rule);
    write(*json_, "stored", finding.stored);
    write(*json_, "found", finding.found);
    if (finding.entries) json_->number("first", finding.entries->first).number("count", finding.entries->count);
    if (finding.others) json_->path("otherFile", *finding.others->file).number("otherFirst", finding.others->first);
    if (finding.lid) json_->number("lid", *finding.lid);
    json_->text("message", lineOf(finding)).end();
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

void Report::finish() const {
    if (session_.json) {
        Json json("");
        json.begin("summary")
            .boolean("summary", true)
            .number("files", files_)
            .number("entries", entries_)
            .number("findings", findings_)
            .texts("notCompared", gaps())
            .end();
        return;
    }
    epinspect::print(counted(files_, "file", "files") + ", " + counted(entries_, "entry", "entries") + ", " +
                     counted(findings_, "finding", "findings") + "\n");
    for (const std::string& text : gaps()) epinspect::print("Not compared: " + forReader(text) + "\n");
}

}  // namespace epinspect
