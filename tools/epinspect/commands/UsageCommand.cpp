// epinspect usage: who uses the space, and how much of it.
#include <memory>
#include <set>

#include "commands/Commands.h"
#include "commands/MapArguments.h"
#include "commands/PlaceOptions.h"
#include "commands/UsageOutput.h"
#include "store/Volumes.h"

namespace epinspect {

namespace {

struct UsageOptions {
    VolumesChoice volumes;
    std::optional<AddressBits> addressBits;
    bool chart = false;
};

void showVolume(const UsageOptions& options, Session& session, const Volume& volume, UsageOutput& output) {
    std::set<std::optional<std::uint32_t>> sizes;
    std::string known;
    for (const VolumeMap& map : volume.maps) {
        if (sizes.insert(map.extentSize).second && map.extentSize) {
            known += (known.empty() ? "" : ", ") + std::to_string(*map.extentSize);
        }
    }
    if (sizes.size() - sizes.count(std::nullopt) > 1) {
        session.remark(volume.folder, "extents of different sizes are counted apart: " + known + " bytes");
    }
    if (sizes.empty()) sizes.insert(options.volumes.extentSize);
    for (const auto& size : sizes) {
        ExtentsInUse use(session, volume, size, options.addressBits);
        if (use.count()) {
            output.print(use);
        } else {
            output.leaveOut();
        }
    }
}

void run(const UsageOptions& options, Session& session) {
    session.remarkOnCollection();
    const Volumes volumes(session, options.volumes);
    if (options.volumes.names.empty() && !volumes.any()) failEmptyStore(session);
    UsageOutput output(session, options.chart);
    volumes.forEach([&](const Volume& volume) { showVolume(options, session, volume, output); });
    output.printSummary();
}

}  // namespace

void addUsage(Command& parent, Session& session) {
    const auto options = std::make_shared<UsageOptions>();
    Command& command = parent.add("usage", "Show who uses the space, by LUN and by data file");
    command.arguments("MAP", "Maps to show: LUN ids, or paths of map files (default: all of the store)",
                      options->volumes.names, parseMap, Command::Need::severalOrNone);
    addLunsOption(command, options->volumes.lids);
    command.option("--extent-size", "SIZE",
                   "Bytes of an extent, for maps whose LUN is not known; K, M, G or KiB, MiB, GiB may follow",
                   options->volumes.extentSize, parseExtentSize);
    addAddressBitsOption(command, options->addressBits);
    command.flag("--chart", "Draw each data file too", options->chart)
        .flag("--json", "One JSON object per LUN and per data file, then a summary", session.json)
        .exclusive("--chart", "--json")
        .action([options, &session] { run(*options, session); });
}

}  // namespace epinspect
