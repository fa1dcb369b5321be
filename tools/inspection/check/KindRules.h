// Rules for the types of table files, free-index files and journals. Which type these kinds have is not known.
#pragma once

#include <ISCSIEPFile.h>

#include <cstdint>
#include <map>
#include <set>
#include <string>
#include <vector>

#include "check/Report.h"
#include "store/Store.h"

namespace inspection {

/// Their types, compared with each other when all files are known.
class KindTypes {
public:
    void add(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFile& content);

    /// `kind`: a type that another kind has too, or that most files of its kind do not have. Returns these files.
    std::set<std::string> check(Report& report) const;

private:
    struct Row {
        std::string file;
        const FileKind* kind;  ///< what the name tells
        std::uint32_t type;
    };
    using Rows = std::vector<Row>;

    const FileKind* ownerOf(std::uint32_t type) const;
    const Row* findLike(const Row& row) const;

    Rows rows_;
    std::map<const FileKind*, std::uint64_t> files_;                                 ///< how many
    std::map<std::uint32_t, std::map<const FileKind*, std::uint64_t>> filesByType_;  ///< how many
};

}  // namespace inspection
