#include "store/FileKind.h"

#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileFRI.h>
#include <ISCSIEPFileJNL.h>
#include <ISCSIEPFileMAP.h>
#include <ISCSIEPFileTBL.h>

#include "CommandLine.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

void write(Json& object, const tool::ISCSIEPFile& file) {
    object.hexadecimal("head0Checksum", file.head0Checksum)
        .number("head0Version", file.head0Version)
        .hexadecimal("head0MagicCode", file.head0MagicCode)
        .number("head0Type", file.head0Type)
        .text("head0UUID", file.head0UUID)
        .hexadecimal("head0DataStartOffset", file.head0DataStartOffset)
        .number("head0CreateTime", file.head0CreateTime);
}

void writeOwn(Json& object, const tool::ISCSIEPFileTBL& file) {
    object.hexadecimal("head1Checksum", file.head1Checksum)
        .number("extentSize", file.extentSize)
        .number("entrySize", file.entrySize)
        .number("totalCount", file.totalCount);
}

void writeOwn(Json& object, const tool::ISCSIEPFileMAP& file) {
    object.hexadecimal("head1Checksum", file.head1Checksum)
        .hexadecimal("attribute", file.attribute)
        .number("logicBlockSize", file.logicBlockSize)
        .number("totalCount", file.totalCount)
        .text("parentUUID", file.parentUUID)
        .number("parentTotalCount", file.parentTotalCount)
        .hexadecimal("var0Checksum", file.var0Checksum)
        .number("mappedCount", file.mappedCount)
        .hexadecimal("var1Checksum", file.var1Checksum)
        .hexadecimal("seg0Checksum", file.seg0Checksum)
        .number("seg0PoolCount", file.seg0PoolCount)
        .text("sessionUUID", file.sessionUUID)
        .number("promoteTime", file.promoteTime)
        .hexadecimal("var2Checksum", file.var2Checksum)
        .number("syncCount", file.syncCount)
        .hexadecimal("childAttribute", file.childAttribute)
        .text("trackUUID", file.trackUUID)
        .text("previousTrackUUID", file.previousTrackUUID)
        .text("currentTrackUUID", file.currentTrackUUID)
        .texts("poolUUIDs", file.poolUUIDs);
}

void writeOwn(Json& object, const tool::ISCSIEPFileDAT& file) {
    object.hexadecimal("head1Checksum", file.head1Checksum).number("serialNumber", file.serialNumber);
}

void writeOwn(Json& object, const tool::ISCSIEPFileFRI& file) {
    object.hexadecimal("head1Checksum", file.head1Checksum)
        .number("entrySize", file.entrySize)
        .hexadecimal("totalGroupCount", file.totalGroupCount)
        .hexadecimal("var0Checksum", file.var0Checksum)
        .hexadecimal("totalFreeCount", file.totalFreeCount)
        .number("indexHead", file.indexHead);
}

void writeOwn(Json& object, const tool::ISCSIEPFileJNL& file) {
    object.hexadecimal("head1Checksum", file.head1Checksum)
        .number("totalCount", file.totalCount)
        .hexadecimal("var0Checksum", file.var0Checksum)
        .hexadecimal("shutdownTag", file.shutdownTag)
        .number("syncCount", file.syncCount)
        .hexadecimal("var1Checksum", file.var1Checksum)
        .number("lastTransID", file.lastTransID)
        .number("lastRecordStart", file.lastRecordStart)
        .number("lastFlushErrno", file.lastFlushErrno)
        .number("lastRecoveryError", file.lastRecoveryError)
        .number("emptyRecordStart", file.emptyRecordStart);
}

std::string_view lastName(std::string_view path) { return path.substr(path.rfind('/') + 1); }

/// The row of a class; File is what make() makes, and so what the other functions get.
template <typename File>
FileKind kind(const char* name, const char* title, unsigned int type, bool (*isNamed)(std::string_view)) {
    return {name,
            title,
            type,
            isNamed,
            [](const std::string& path) -> std::unique_ptr<tool::ISCSIEPFile> { return std::make_unique<File>(path); },
            [](tool::ISCSIEPFile& file) { return static_cast<File&>(file).parseFile(); },
            [](Json& object, const tool::ISCSIEPFile& file) {
                write(object, file);
                writeOwn(object, static_cast<const File&>(file));
            }};
}

/// The first one whose rule fits a name is taken.
const FileKind kinds[] = {
    kind<tool::ISCSIEPFileTBL>("tbl", "table file", 0,
                               [](std::string_view path) { return lastName(path) == "EP_TBL"; }),
    kind<tool::ISCSIEPFileDAT>("dat", "data file", tool::EP_FILE_TYPE_DAT,
                               [](std::string_view path) { return lastName(path).substr(0, 7) == "EP_DAT_"; }),
    kind<tool::ISCSIEPFileFRI>("fri", "free-index file", 0,
                               [](std::string_view path) { return lastName(path) == "EP_FRI"; }),
    kind<tool::ISCSIEPFileJNL>("jnl", "journal", 0, [](std::string_view path) { return lastName(path) == "EP_JNL"; }),
    kind<tool::ISCSIEPFileMAP>(
        "map", "map file", tool::EP_FILE_TYPE_MAP,
        [](std::string_view path) { return path.find("@iSCSI/LUN/") != std::string_view::npos; }),
};

}  // namespace

const FileKind headKind = {
    "head",
    "HEAD[0]",
    0,
    [](std::string_view) { return false; },
    [](const std::string& path) { return std::make_unique<tool::ISCSIEPFile>(path); },
    [](tool::ISCSIEPFile& file) { return file.parseHead0(); },
    write,
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

const FileKind* parseKind(const std::string& name) {
    std::string names;
    for (const FileKind* kind = std::begin(kinds); kind != std::end(kinds); ++kind) {
        if (name == kind->name) return kind;
        names.append(kind->name).append(", ");
    }
    if (name == headKind.name) return &headKind;
    throw UsageError{"not one of " + names + headKind.name};
}

}  // namespace epinspect
