// How findings are worded: a line each, or an object.
#pragma once

#include <optional>
#include <string>

#include "check/Report.h"
#include "frame/Json.h"
#include "frame/Session.h"

namespace epinspect {

class FindingOutput {
public:
    explicit FindingOutput(Session& session) : session_(session) {}

    /// Throws OutputFailure, as the next one.
    void print(const Finding& finding);

    /// The totals, and what could not be compared.
    void printSummary(const Report& report) const;

private:
    void printAsJson(const Finding& finding);
    void printSummaryAsJson(const Report& report, std::uint64_t findings) const;

    Session& session_;
    std::optional<Json> json_;  ///< for findings in `jsonFile_`
    std::string jsonFile_;
};

}  // namespace epinspect
