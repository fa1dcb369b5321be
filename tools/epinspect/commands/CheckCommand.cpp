// epinspect check: what files say of themselves and of each other, compared.
#include <memory>

#include "check/StoreCheck.h"
#include "commands/Commands.h"
#include "commands/FindingOutput.h"
#include "commands/MapArguments.h"
#include "frame/Numbers.h"

namespace epinspect {

void addCheck(Command& parent, Session& session) {
    const auto options = std::make_shared<CheckOptions>();
    const auto each = std::make_shared<bool>(false);
    Command& command = parent.add("check", "Compare files with themselves and with each other");
    command.arguments("FILE", "EP files, or LUN ids for their maps (default: all of the store)", options->files,
                      parseMap, Command::Need::severalOrNone);
    addLunsOption(command, options->lids);
    command.flag("--each", "Show every run of entries, not only how many there are and the first", *each)
        .option("--extent-size", "SIZE",
                "Bytes of an extent, for maps whose LUN is not known; K, M, G or KiB, MiB, GiB may follow",
                options->extentSize, parseExtentSize)
        .flag("--json", "One JSON object per finding, then a summary", session.json)
        .action([options, each, &session] {
            session.remarkOnCollection();
            FindingOutput output(session);
            Report report(session, *each, [&output](const Finding& finding) { output.print(finding); });
            StoreCheck(session, *options, report).run();
            output.printSummary(report);
        });
}

}  // namespace epinspect
