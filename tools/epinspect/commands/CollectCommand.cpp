// epinspect collect: what is needed to look at a store elsewhere, without its data.
#include <etc/ISCSIEPFormat.h>

#include <ctime>
#include <filesystem>
#include <memory>

#include "commands/Commands.h"
#include "commands/MapArguments.h"
#include "frame/Interruption.h"
#include "frame/Output.h"
#include "store/Collector.h"
#include "store/Folder.h"
#include "store/Luns.h"

namespace epinspect {

namespace fs = std::filesystem;
namespace tool = ISCSI::TOOL;

namespace {

struct CollectOptions {
    std::string folder;
    Lids lids = usualLids;
};

/// Whether `folder` lies inside the store that is collected.
bool isInsideStore(const Session& session, const fs::path& folder) {
    std::error_code error;
    const std::string path = fs::weakly_canonical(folder, error).string() + "/";
    const std::string root =
        session.root.isFolder() ? fs::canonical(session.root.hostPath("/"), error).string() + "/" : "";
    if (!root.empty()) return path.compare(0, root.size(), root) == 0;
    return path.find(tool::EP_ISCSI_FOLDER) != std::string::npos || path.rfind(tool::EP_JNL_FOLDER, 0) == 0;
}

/// Makes the folder; reports why it cannot be used.
bool makeFolder(Session& session, const std::string& name) {
    const auto refuse = [&](const char* what, int reason) {
        session.failed({{name, ""}, 0, reason, what});
        return false;
    };
    std::error_code error;
    const fs::path folder = fs::absolute(name, error);
    if (fs::exists(folder, error)) {
        if (!fs::is_directory(folder, error)) return refuse("is not a folder", 0);
        const Listing there = listHere(folder.string(), name);
        if (there.failure) return refuse("cannot be looked into", there.failure->reason);
        if (!there.names.empty())
            return refuse("is not empty, and nothing is overwritten; name a new folder or an empty one", 0);
    }
    if (isInsideStore(session, folder)) return refuse("lies inside the store, which is never written", 0);
    fs::create_directories(folder, error);
    return error ? refuse("cannot be made", error.value()) : true;
}

void run(const CollectOptions& options, Session& session) {
    if (!makeFolder(session, options.folder)) return;
    holdInterruptions();
    Collector collector(session, options.folder, std::string("epinspect ") + EPINSPECT_VERSION, std::time(nullptr));
    collector.run(options.lids);
    session.endProgress();
    const bool complete = session.status() == 0 && !isInterrupted();
    if (!collector.finish(complete) || !complete) {
        session.failed(
            {{options.folder, ""},
             0,
             0,
             isInterrupted() ? "interrupted: the collection is incomplete" : "the collection is incomplete"});
    }
    std::uint64_t bytes = 0;
    for (const CollectedFile& file : collector.collection().files) bytes += file.taken;
    print(counted(collector.collection().files.size(), "file", "files") + " and " +
          counted(collector.luns(), "LUN", "LUNs") + " collected, " + counted(bytes, "byte", "bytes") + ": " +
          forReader(options.folder) + "\n");
}

}  // namespace

void addCollect(Command& parent, Session& session) {
    const auto options = std::make_shared<CollectOptions>();
    Command& command = parent.add("collect", "Copy all but the data into a folder, to look at the store elsewhere");
    command.argument("FOLDER", "New or empty folder; what is collected there is a store for --root", options->folder);
    addLunsOption(command, options->lids);
    command.action([options, &session] { run(*options, session); });
}

}  // namespace epinspect
