// epinspect lun: the configuration of LUNs and where their map files lie.
#include <CLI/App.hpp>
#include <memory>
#include <vector>

#include "Json.h"
#include "Numbers.h"
#include "Output.h"
#include "commands/Commands.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

struct LunOptions {
    std::vector<std::string> lids;
    bool json = false;
};

void printLun(const LunOptions& options, Session& session, std::uint32_t lid) {
    const std::string subject = "LUN " + std::to_string(lid);
    tool::ISCSILUNConfInfo lun(lid);
    std::string mapPath;
    if (!session.succeeded(lun.loadFromConfig(), subject)) return;
    if (!session.succeeded(tool::ISCSIEPFileMAP().getMAPFilePath(lid, mapPath), subject)) return;
    if (options.json) {
        Json object = fileObject(mapPath);
        addMembers(object, lun);
        printJson(object);
        return;
    }
    print(forReader(lun.toString()) + "\n" + forReader(mapPath) + "\n");
}

}  // namespace

void addLun(CLI::App& app, Session& session) {
    const auto options = std::make_shared<LunOptions>();
    CLI::App* command = app.add_subcommand("lun", "Show the configuration of LUNs and the paths of their map files");
    command->add_option("LID", options->lids, "LUN ids")->required();
    command->add_flag("--json", options->json, "One JSON object a LUN");
    command->callback([options, &session] {
        std::vector<std::uint32_t> lids;
        for (const std::string& text : options->lids) lids.push_back(parseNumber32(text));
        for (const std::uint32_t lid : lids) printLun(*options, session, lid);
    });
}

}  // namespace epinspect
