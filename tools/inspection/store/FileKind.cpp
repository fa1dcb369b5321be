#include "store/FileKind.h"

#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileFRI.h>
#include <ISCSIEPFileJNL.h>
#include <ISCSIEPFileMAP.h>
#include <ISCSIEPFileTBL.h>
#include <etc/ISCSIEPFormat.h>

#include "store/FileNames.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

/// The row of a class; File is what make() makes, and so what parse() gets.
template <typename File>
FileKind kind(const char* name, const char* title, unsigned int type, bool (*isNamed)(std::string_view)) {
    return {name,
            title,
            type,
            isNamed,
            [](const std::string& path) -> std::unique_ptr<tool::ISCSIEPFile> { return std::make_unique<File>(path); },
            [](tool::ISCSIEPFile& file) { return static_cast<File&>(file).parseFile(); }};
}

/// The first one whose rule fits a name is taken.
const FileKind kinds[] = {
    kind<tool::ISCSIEPFileTBL>("tbl", "table file", 0,
                               [](std::string_view path) { return lastName(path) == tool::EP_TBL_FILE_NAME; }),
    kind<tool::ISCSIEPFileDAT>("dat", "data file", tool::EP_FILE_TYPE_DAT, isDataFileName),
    kind<tool::ISCSIEPFileFRI>("fri", "free-index file", 0,
                               [](std::string_view path) { return lastName(path) == tool::EP_FRI_FILE_NAME; }),
    kind<tool::ISCSIEPFileJNL>("jnl", "journal", 0,
                               [](std::string_view path) { return lastName(path) == tool::EP_JNL_FILE_NAME; }),
    kind<tool::ISCSIEPFileMAP>(
        "map", "map file", tool::EP_FILE_TYPE_MAP,
        [](std::string_view path) { return path.find(tool::EP_MAP_FOLDER + 1) != std::string_view::npos; }),
};

}  // namespace

const FileKind headKind = {
    "head",
    "HEAD[0]",
    0,
    [](std::string_view) { return false; },
    [](const std::string& path) { return std::make_unique<tool::ISCSIEPFile>(path); },
    [](tool::ISCSIEPFile& file) { return file.parseHead0(); },
};

const FileKind* kindByName(std::string_view path) {
    for (const FileKind& kind : kinds) {
        if (kind.isNamed(path)) return &kind;
    }
    return nullptr;
}

const FileKind* kindByType(unsigned int type) {
    for (const FileKind& kind : kinds) {
        if (type != 0 && kind.type == type) return &kind;
    }
    return nullptr;
}

const FileKind* kindCalled(std::string_view name) {
    for (const FileKind& kind : kinds) {
        if (name == kind.name) return &kind;
    }
    return name == headKind.name ? &headKind : nullptr;
}

std::string kindNames() {
    std::string names;
    for (const FileKind& kind : kinds) names.append(kind.name).append(", ");
    return names + headKind.name;
}

}  // namespace inspection
