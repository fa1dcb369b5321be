// epinspect dump: header blocks as the library shows them.
#include <memory>

#include "commands/Commands.h"
#include "commands/HeaderOutput.h"
#include "commands/MapArguments.h"
#include "frame/Json.h"
#include "frame/Output.h"
#include "store/Doubts.h"
#include "store/FileKind.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

struct DumpOptions {
    std::vector<LunName> files;
    const FileKind* kind = nullptr;  ///< --as
};

/// The kind that follows from the type in HEAD[0] of the file at `path`; HEAD[0] alone when none does; null after a
/// failure.
const FileKind* kindFromType(Session& session, const std::string& name, const std::string& path) {
    tool::ISCSIEPFile head(path);
    if (!session.succeeded(head.parseHead0(), {name, ""})) return nullptr;
    const FileKind* kind = kindByType(head.head0Type);
    if (kind != nullptr) return kind;
    session.remark(name, "kind not known from its name or type, only HEAD[0] is shown");
    return &headKind;
}

const FileKind* parseKind(const std::string& name) {
    const FileKind* kind = kindCalled(name);
    if (kind == nullptr) throw UsageError{"not one of " + kindNames()};
    return kind;
}

/// `lids` are those of the LUN whose map was named by its id.
void dumpFile(const DumpOptions& options, Session& session, const std::string& name, NamedBy by,
              const std::vector<std::uint32_t>& lids) {
    const std::optional<std::string> path = session.openablePath(name, by);
    if (!path) return;
    const FileKind* byName = options.kind == nullptr ? kindByName(session.root.targetPath(name)) : nullptr;
    const FileKind* kind = options.kind != nullptr ? options.kind : byName;
    if (kind == nullptr) kind = kindFromType(session, name, *path);
    if (kind == nullptr) return;
    const auto file = kind->make(*path);
    if (!session.succeeded(kind->parse(*file), {name, ""})) return;
    remarkOnKind(session, *file, name, byName);
    remarkOnDataStart(session, *file, name);
    if (kind->type == tool::EP_FILE_TYPE_MAP) remarkOnPartialEntry(session, *file, name);
    if (session.json) {
        Json object(name, lids);
        object.begin(kind->name);
        for (const HeaderField& field : headerFieldsOf(*file)) writeValue(object, field.name, field);
        object.end();
        return;
    }
    if (options.files.size() > 1) print(forReader(name) + ":\n");
    print(file->toString());
}

void dumpNamed(const DumpOptions& options, Session& session, const LunName& name) {
    if (!name.lid) {
        dumpFile(options, session, name.file, NamedBy::user, {});
    } else if (const std::optional<NamedMap> map = findMap(session, name)) {
        dumpFile(options, session, map->file, map->by, map->lids());
    }
}

}  // namespace

void addDump(Command& parent, Session& session) {
    const auto options = std::make_shared<DumpOptions>();
    parent.add("dump", "Show the header block of EP files")
        .arguments("FILE", "EP files, or LUN ids for their maps", options->files, parseMap)
        .option("--as", "KIND",
                "Kind of the files, whatever their name and type: tbl, map, dat, fri, jnl, or head for "
                "HEAD[0] alone",
                options->kind, parseKind)
        .flag("--json", "One JSON object per file", session.json)
        .action([options, &session] {
            for (const LunName& name : options->files) dumpNamed(*options, session, name);
        });
}

}  // namespace epinspect
