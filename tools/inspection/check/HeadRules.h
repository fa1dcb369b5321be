// Rules for every EP file: what HEAD[0] says.
#pragma once

#include <ISCSIEPFile.h>

#include <string>
#include <vector>

#include "check/Report.h"
#include "store/Store.h"

namespace inspection {

/// `kind`: the type against the file's name. Returns whether they agree.
bool checkKind(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFile& content, Report& report);

/// `data-start`: whether it lies after the header block and inside the file.
void checkDataStart(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFile& content, Report& report);

/// `magic` and `version`: each against the value that most of the files have.
class CommonValues {
public:
    void add(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFile& content);
    void check(Report& report) const;

private:
    struct Row {
        std::string file;
        std::uint64_t magic;
        std::uint32_t version;
    };

    void checkMagic(Report& report) const;
    void checkVersion(Report& report) const;

    std::vector<Row> rows_;
};

}  // namespace inspection
