// What `check` finds, and how it is told.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>

#include "Json.h"
#include "Session.h"

namespace epinspect {

/// Something that is stored, or was found elsewhere, as JSON shows it.
struct Value {
    enum class Form { number, hexadecimal, text };

    static Value number(std::uint64_t value) { return {Form::number, value, {}}; }
    static Value hexadecimal(std::uint64_t value) { return {Form::hexadecimal, value, {}}; }
    static Value text(std::string value) { return {Form::text, 0, std::move(value)}; }

    /// The value alone, for messages.
    std::string shown() const;

    Form form;
    std::uint64_t bits;
    std::string words;
};

/// A difference between what a file says of itself and what it or another one holds.
struct Finding {
    /// Entries of a map.
    struct Entries {
        const std::string* file;
        std::uint64_t first;
        std::uint64_t count;
    };

    const std::string& file;
    const char* rule;
    Value stored;
    Value found;
    std::string message;  ///< what is stored, what was found
    std::optional<Entries> entries = std::nullopt;
    std::optional<Entries> others = std::nullopt;  ///< with which these entries share their extents
    std::optional<std::uint32_t> lid = std::nullopt;
};

/// Prints findings as they come, and sums up.
class Report {
public:
    explicit Report(Session& session) : session_(session) {}

    void add(const Finding& finding);

    /// Remembers that `what` could not be compared, where it concerns one file: which one.
    void notCompared(const std::string& what, const std::string& file = {});

    /// Counts a file that has been read, and the entries of a map.
    void countFile() { ++files_; }
    void countEntries(std::uint64_t count) { entries_ += count; }

    /// Prints the totals and what could not be compared.
    void finish() const;

private:
    struct Files {
        std::uint64_t count = 0;
        std::string first;
    };

    void print(const Finding& finding) const;
    void printAsJson(const Finding& finding);
    std::vector<std::string> gaps() const;

    Session& session_;
    std::optional<Json> json_;  ///< for findings in `jsonFile_`
    std::string jsonFile_;
    std::uint64_t files_ = 0;
    std::uint64_t entries_ = 0;
    std::uint64_t findings_ = 0;
    std::map<std::string, Files> notCompared_;
};

/// "entry 3" or "entries 3-5".
std::string entriesText(std::uint64_t first, std::uint64_t count);

/// "extent 3" or "extents 3-5".
std::string extentsText(std::uint64_t first, std::uint64_t count);

}  // namespace epinspect
