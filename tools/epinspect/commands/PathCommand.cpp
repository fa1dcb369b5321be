// epinspect path: where EP files lie on the target.
#include <ISCSIEPFile.h>

#include <CLI/App.hpp>
#include <memory>
#include <string_view>

#include "Numbers.h"
#include "Output.h"
#include "commands/Commands.h"

namespace epinspect {

using ISCSI::TOOL::ISCSIEPFile;

namespace {

struct PathOptions {
    std::string file;
    std::uint32_t lid = 0;
    std::uint32_t extentSize = 0;
    std::uint64_t extentAddress = 0;
};

using Options = std::shared_ptr<PathOptions>;

/// Adds "path KIND"; `find` is the operation of the library that gives the path, from a file the user names.
template <typename Find>
CLI::App* addKind(CLI::App& path, Session& session, const Options& options, const char* kind, const char* about,
                  Find find) {
    CLI::App* command = path.add_subcommand(kind, about);
    const bool lun = std::string_view(kind) == "map";
    command->callback([options, &session, find, lun] {
        std::string result;
        const std::string& name = options->file;
        const std::string subject = lun ? "LUN " + std::to_string(options->lid) : name;
        const ISCSIEPFile file(session.targetPath(name));
        if (session.succeeded(find(file, result), subject)) print(forReader(result) + "\n");
    });
    return command;
}

CLI::App* takesFile(CLI::App* command, const Options& options) {
    command->add_option("EPFILE", options->file, "An EP file of the volume; it is not opened")->required();
    return command;
}

}  // namespace

void addPath(CLI::App& app, Session& session) {
    const auto options = std::make_shared<PathOptions>();
    CLI::App* path = app.add_subcommand("path", "Tell where an EP file lies on the target");
    path->require_subcommand(1);
    takesFile(addKind(*path, session, options, "tbl", "The table file of a volume",
                      [](const ISCSIEPFile& file, std::string& result) { return file.getTBLFilePath(result); }),
              options);
    takesFile(addKind(*path, session, options, "fri", "The free-index file of a volume",
                      [](const ISCSIEPFile& file, std::string& result) { return file.getFRIFilePath(result); }),
              options);
    takesFile(addKind(*path, session, options, "jnl", "The journal of the machine",
                      [](const ISCSIEPFile& file, std::string& result) { return file.getJNLFilePath(result); }),
              options);
    CLI::App* dat =
        takesFile(addKind(*path, session, options, "dat", "The data file that holds an extent address",
                          [options](const ISCSIEPFile& file, std::string& result) {
                              return file.getDATFilePath(options->extentSize, options->extentAddress, result);
                          }),
                  options);
    addParsed(dat, "--extent-size", "Bytes of an extent; K, M or G may follow", options->extentSize, parseSize)
        ->required();
    addParsed(dat, "--extent-address", "Extent address, as a map entry holds it", options->extentAddress, parseNumber)
        ->required();
    CLI::App* map = addKind(
        *path, session, options, "map", "The map file of a LUN",
        [options](const ISCSIEPFile& file, std::string& result) { return file.getMAPFilePath(options->lid, result); });
    addParsed(map, "LID", "LUN id", options->lid, parseNumber32)->required();
}

}  // namespace epinspect
