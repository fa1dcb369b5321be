// epinspect dump: header blocks as the library shows them.
#include <CLI/App.hpp>
#include <memory>
#include <string_view>
#include <vector>

#include "Json.h"
#include "Output.h"
#include "commands/Commands.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

struct DumpOptions {
    std::vector<std::string> files;
    std::string kind;
    bool json = false;
};

/// The kind that a file's name tells, "" when it tells none.
std::string_view kindFromName(std::string_view path) {
    const auto name = path.substr(path.rfind('/') + 1);
    if (name == "EP_TBL") return "tbl";
    if (name == "EP_FRI") return "fri";
    if (name == "EP_JNL") return "jnl";
    if (name.substr(0, 7) == "EP_DAT_") return "dat";
    return path.find("@iSCSI/LUN/") != std::string_view::npos ? "map" : "";
}

/// The kind that the type in HEAD[0] tells, "head" when it tells none.
std::string_view kindFromType(const tool::ISCSIEPFile& file) {
    if (file.head0Type == tool::EP_FILE_TYPE_DAT) return "dat";
    return file.head0Type == tool::EP_FILE_TYPE_MAP ? "map" : "head";
}

int parse(tool::ISCSIEPFile& file) { return file.parseHead0(); }

template <typename File>
int parse(File& file) {
    return file.parseFile();
}

template <typename File>
void dumpAs(const DumpOptions& options, Session& session, const std::string& name, const std::string& path) {
    File file(path);
    if (!session.succeeded(parse(file), name)) return;
    if (options.json) {
        Json object = fileObject(name);
        addMembers(object, file);
        printJson(object);
        return;
    }
    if (options.files.size() > 1) print(forReader(name) + ":\n");
    print(file.toString());
}

void dumpFile(const DumpOptions& options, Session& session, const std::string& name) {
    const std::optional<std::string> found = session.openablePath(name);
    if (!found) return;
    const std::string& path = *found;
    std::string_view kind = options.kind;
    if (kind.empty()) kind = kindFromName(path);
    if (kind.empty()) {
        tool::ISCSIEPFile head(path);
        if (!session.succeeded(head.parseHead0(), name)) return;
        kind = kindFromType(head);
    }
    if (kind == "tbl") return dumpAs<tool::ISCSIEPFileTBL>(options, session, name, path);
    if (kind == "map") return dumpAs<tool::ISCSIEPFileMAP>(options, session, name, path);
    if (kind == "dat") return dumpAs<tool::ISCSIEPFileDAT>(options, session, name, path);
    if (kind == "fri") return dumpAs<tool::ISCSIEPFileFRI>(options, session, name, path);
    if (kind == "jnl") return dumpAs<tool::ISCSIEPFileJNL>(options, session, name, path);
    dumpAs<tool::ISCSIEPFile>(options, session, name, path);
}

}  // namespace

void addDump(CLI::App& app, Session& session) {
    const auto options = std::make_shared<DumpOptions>();
    CLI::App* command = app.add_subcommand("dump", "Show the header block of EP files");
    command->add_option("FILE", options->files, "EP files")->required()->type_name("");
    command->add_option("--as", options->kind, "Take the files for this kind, whatever their name and type tell")
        ->check(CLI::IsMember({"tbl", "map", "dat", "fri", "jnl", "head"}));
    command->add_flag("--json", options->json, "One JSON object a file");
    command->callback([options, &session] {
        for (const std::string& name : options->files) dumpFile(*options, session, name);
    });
}

}  // namespace epinspect
