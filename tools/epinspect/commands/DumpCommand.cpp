// epinspect dump: header blocks as the library shows them.
#include <memory>

#include "Json.h"
#include "Output.h"
#include "commands/Commands.h"
#include "store/Doubts.h"
#include "store/FileKind.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

struct DumpOptions {
    std::vector<std::string> files;
    const FileKind* kind = nullptr;  ///< --as
};

/// The kind that the type in HEAD[0] of the file at `path` tells, and HEAD[0] alone when it tells none; null after a
/// failure.
const FileKind* kindFromType(Session& session, const std::string& name, const std::string& path) {
    tool::ISCSIEPFile head(path);
    if (!session.succeeded(head.parseHead0(), {name, ""})) return nullptr;
    const FileKind* kind = kindByType(head.head0Type);
    if (kind != nullptr) return kind;
    complain(name + ": neither name nor type tells its kind, only HEAD[0] is shown");
    return &headKind;
}

void dumpFile(const DumpOptions& options, Session& session, const std::string& name) {
    const std::optional<std::string> path = session.openablePath(name);
    if (!path) return;
    const FileKind* byName = options.kind == nullptr ? kindByName(session.targetPath(name)) : nullptr;
    const FileKind* kind = options.kind != nullptr ? options.kind : byName;
    if (kind == nullptr) kind = kindFromType(session, name, *path);
    if (kind == nullptr) return;
    const auto file = kind->make(*path);
    if (!session.succeeded(kind->parse(*file), {name, ""})) return;
    sayKindDoubts(*file, name, byName);
    sayDataStartDoubts(*file, name);
    if (kind->type == tool::EP_FILE_TYPE_MAP) sayPartialEntry(*file, name);
    if (session.json) {
        Json object(name);
        kind->writeMembers(object.begin(kind->name), *file);
        object.end();
        return;
    }
    if (options.files.size() > 1) print(forReader(name) + ":\n");
    print(file->toString());
}

}  // namespace

void addDump(Command& parent, Session& session) {
    const auto options = std::make_shared<DumpOptions>();
    parent.add("dump", "Show the header block of EP files")
        .arguments("FILE", "EP files", options->files)
        .option("--as", "KIND",
                "Take the files for this kind, whatever their name and type tell: tbl, map, dat, fri, jnl, or head for "
                "HEAD[0] alone",
                options->kind, parseKind)
        .flag("--json", "One JSON object a file", session.json)
        .action([options, &session] {
            for (const std::string& name : options->files) dumpFile(*options, session, name);
        });
}

}  // namespace epinspect
