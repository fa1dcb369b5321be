// epinspect collect: what is needed to look at a store elsewhere, without its data.
#include <ctime>
#include <filesystem>
#include <memory>
#include <set>

#include "commands/Commands.h"
#include "commands/MapArguments.h"
#include "frame/Interruption.h"
#include "frame/Output.h"
#include "store/Collector.h"
#include "store/FileNames.h"
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

/// The folders below which nothing may be written. Of a copy that is all of it; the machine itself has room beside its
/// store.
std::set<FileIdentity> foldersOfStore(const Session& session) {
    std::set<FileIdentity> folders;
    const auto add = [&](const std::string& path) {
        const Located located = session.root.locate(path);
        if (located.isThere()) folders.insert(located.identity);
    };
    const bool isCopy = session.root.isFolder() && session.root.locate("/").identity != identityOf("/");
    if (isCopy) add("/");
    add("/var/db/iscsi");
    for (const std::string& name : listFolder(session, "/").names) {
        if (volumeIn(name) != 0) add("/" + name + (isCopy ? "" : "/@iSCSI"));
    }
    return folders;
}

/// Whether `folder`, which need not be there, lies inside the store that is collected, whatever names lead there.
bool isInsideStore(const Session& session, const fs::path& folder) {
    const std::set<FileIdentity> store = foldersOfStore(session);
    std::error_code error;
    for (fs::path above = fs::weakly_canonical(folder, error); above.has_relative_path(); above = above.parent_path()) {
        const auto identity = identityOf(above.string());
        if (above.filename() == "@iSCSI" || (identity && store.count(*identity) > 0)) return true;
    }
    return false;
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
    session.listing = false;
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
