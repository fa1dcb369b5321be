// How differences of files are worded: a line each, or an object.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

#include "frame/Json.h"
#include "frame/Session.h"
#include "store/FileDiff.h"

namespace epinspect {

/// What differs in all.
struct DiffTotals {
    std::uint64_t files = 0;  ///< of two stores: those compared, and those that only one has
    std::uint64_t onlyFirst = 0, onlySecond = 0;
    std::uint64_t fields = 0;
    DiffSummary entries;
};

/// A file, or the folder of a store, as the user called it; of a map the LUNs that it is known to be of.
struct DiffName {
    std::string file;
    std::vector<std::uint32_t> lids = {};
};

/// Writes what differs between two files. Throws OutputFailure.
class DiffOutput {
public:
    /// `path` starts each line of text, where several files are compared.
    DiffOutput(Session& session, const DiffName& file, DiffName otherFile, const std::string& path);

    void print(const FieldDifference& difference);
    void print(const DiffRun& run);

private:
    void printAsJson(const DiffRun& run);

    Session& session_;
    DiffName otherFile_;
    std::string prefix_;
    Json json_;
    LineBuffer line_;
};

/// A file that only one of two stores has.
void printOnlyInOne(Session& session, const FilePair& pair);

/// What is compared: header fields, entries, or both; of files, or of the files of two stores.
struct DiffScope {
    bool headers = true;
    bool entries = true;
    bool stores = false;
};

void printSummary(const Session& session, const DiffName& file, const DiffName& otherFile, const DiffTotals& totals,
                  const DiffScope& scope);

}  // namespace epinspect
