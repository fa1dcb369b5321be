// The kinds of EP files: how each is recognised and read.
#pragma once

#include <ISCSIEPFile.h>

#include <memory>
#include <string>
#include <string_view>

namespace inspection {

struct FileKind {
    const char* name;   ///< as --as takes it, and "kind" in JSON
    const char* title;  ///< for messages
    unsigned int type;  ///< its type in HEAD[0], 0 where that is not known

    /// Whether a file at this path of the target is of this kind by its name.
    bool (*isNamed)(std::string_view path);

    /// An object of the kind's class, which the next function takes.
    std::unique_ptr<ISCSI::TOOL::ISCSIEPFile> (*make)(const std::string& path);

    /// Decodes the header block, as the class's parseFile() does.
    int (*parse)(ISCSI::TOOL::ISCSIEPFile& file);
};

/// HEAD[0] alone, whatever the file is.
extern const FileKind headKind;

/// The kind that the name of a file at `path` of the target tells, null when it tells none.
const FileKind* kindByName(std::string_view path);

/// The kind that a type in HEAD[0] tells, null when it tells none.
const FileKind* kindByType(unsigned int type);

/// The kind called `name`, HEAD[0] alone included; null when there is none. And all of these names: "tbl, dat, ...".
const FileKind* kindCalled(std::string_view name);
std::string kindNames();

}  // namespace inspection
