// What is doubtful about a file whose HEAD[0] is decoded: the remarks beside a dump and the findings of a check rest on
// the same tests.
#pragma once

#include <ISCSIEPFile.h>

#include <cstdint>
#include <optional>
#include <string>

#include "store/Context.h"
#include "store/FileKind.h"

namespace inspection {

/// The name tells one kind, the type in HEAD[0] another one.
struct KindDoubt {
    const FileKind* byName;
    unsigned int type;
    const FileKind* byType;  ///< null where the type tells no kind
};

/// `byName`: the kind that the file's name tells, null when it tells none.
std::optional<KindDoubt> kindDoubtOf(const ISCSI::TOOL::ISCSIEPFile& file, const FileKind* byName);

/// The data start offset lies before `limit`, the end of the header block, or past `limit`, the end of the file.
struct DataStartDoubt {
    bool insideHeader;
    std::uint64_t limit;
};

/// `size` is that of the file; nothing: not known.
std::optional<DataStartDoubt> dataStartDoubtOf(const ISCSI::TOOL::ISCSIEPFile& file, std::optional<std::uint64_t> size);

/// A map file ends inside an entry.
struct PartialEntry {
    std::uint64_t index;
    std::uint64_t bytes;  ///< how many of the entry are there
};

std::optional<PartialEntry> partialEntryOf(const ISCSI::TOOL::ISCSIEPFile& file, std::optional<std::uint64_t> size);

/// Each remarks on one of these doubts, where there is one, about the file that the user called `name`.
void remarkOnKind(Context& context, const ISCSI::TOOL::ISCSIEPFile& file, const std::string& name,
                  const FileKind* byName);
void remarkOnDataStart(Context& context, const ISCSI::TOOL::ISCSIEPFile& file, const std::string& name);
void remarkOnPartialEntry(Context& context, const ISCSI::TOOL::ISCSIEPFile& file, const std::string& name);

}  // namespace inspection
