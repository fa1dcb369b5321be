// What the lookups beyond the header block have in common: the way to the item they read, and how each step fails.
#pragma once

#include <cstdint>

#include "EPFileStream.h"
#include "ISCSIEPFile.h"

namespace ISCSI::TOOL {

/// What tells one lookup from another: how the log names it (source file, operation, and a line for each failure), and
/// the type of file it needs.
struct EPLookupIdentity {
    const char* sourceFile;
    const char* operation;
    unsigned int fileType;
    int parseLine = 0, typeLine = 0, openLine = 0, seekLine = 0, readLine = 0;

    constexpr EPLookupIdentity(const char* inFile, const char* name, unsigned int type)
        : sourceFile(inFile), operation(name), fileType(type) {}

    constexpr EPLookupIdentity parseFailsAt(int line) const { return with(&EPLookupIdentity::parseLine, line); }
    constexpr EPLookupIdentity typeFailsAt(int line) const { return with(&EPLookupIdentity::typeLine, line); }
    constexpr EPLookupIdentity openFailsAt(int line) const { return with(&EPLookupIdentity::openLine, line); }
    constexpr EPLookupIdentity seekFailsAt(int line) const { return with(&EPLookupIdentity::seekLine, line); }
    constexpr EPLookupIdentity readFailsAt(int line) const { return with(&EPLookupIdentity::readLine, line); }

private:
    constexpr EPLookupIdentity with(int EPLookupIdentity::*member, int line) const {
        EPLookupIdentity changed = *this;
        changed.*member = line;
        return changed;
    }
};

/// Decodes HEAD[0] of `file` unless that is done, tests its type, then opens `stream` on its path. Returns 0 or the
/// code of the failure it logged.
int openForLookup(ISCSIEPFile& file, EPFileStream& stream, const EPLookupIdentity& lookup);

/// openForLookup(), then goes to `offset` (modulo 2^64) after the data start offset.
int seekToItem(ISCSIEPFile& file, EPFileStream& stream, const EPLookupIdentity& lookup, std::uint64_t offset);

/// Each logs the failed step of a lookup and returns its code.
int seekFailed(const ISCSIEPFile& file, const EPLookupIdentity& lookup);
int readFailed(const ISCSIEPFile& file, const EPLookupIdentity& lookup);

}  // namespace ISCSI::TOOL
