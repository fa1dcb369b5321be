// epinspect check: what files say of themselves and of each other, compared.
#include <memory>

#include "check/StoreCheck.h"
#include "commands/Commands.h"
#include "commands/FindingOutput.h"
#include "frame/Numbers.h"

namespace epinspect {

namespace {

std::uint32_t parseExtentSize(const std::string& text) {
    const std::uint32_t size = parseSize32(text);
    if (size == 0) throw UsageError{"must not be 0"};
    return size;
}

}  // namespace

void addCheck(Command& parent, Session& session) {
    const auto options = std::make_shared<CheckOptions>();
    const auto each = std::make_shared<bool>(false);
    parent.add("check", "Compare files with themselves and with each other")
        .arguments("FILE", "EP files (default: all of the store)", options->files, Command::Need::severalOrNone)
        .flag("--each", "Show every run of entries, not only how many there are and the first", *each)
        .option("--luns", "FIRST-LAST", "LUN ids to look for (default: 0-255)", options->lids, parseRange32)
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
