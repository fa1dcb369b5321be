// epinspect path: where EP files lie on the target.
#include <ISCSIEPFile.h>

#include <cerrno>
#include <limits>
#include <memory>

#include "commands/Commands.h"
#include "commands/MapArguments.h"
#include "frame/Numbers.h"
#include "frame/Output.h"
#include "store/Luns.h"

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

/// Adds "path KIND EPFILE"; `find` is the operation of the library that gives the path, from a file the user names.
template <typename Find>
Command& addKind(Command& path, Session& session, const Options& options, const char* kind, const char* about,
                 Find find, Command::Need need = Command::Need::one) {
    return path.add(kind, about)
        .argument("EPFILE", "An EP file of the volume; it is not opened", options->file, need)
        .action([options, &session, find] {
            std::string result;
            const ISCSIEPFile file(session.root.targetPath(options->file));
            if (session.succeeded(find(file, result), {options->file, ""})) print(forReader(result) + "\n");
        });
}

}  // namespace

void addPath(Command& parent, Session& session) {
    const auto options = std::make_shared<PathOptions>();
    Command& path = parent.add("path", "Show where an EP file lies on the target");
    path.group("Kinds of files");
    addKind(path, session, options, "tbl", "The table file of a volume",
            [](const ISCSIEPFile& file, std::string& result) { return file.getTBLFilePath(result); });
    addKind(path, session, options, "fri", "The free-index file of a volume",
            [](const ISCSIEPFile& file, std::string& result) { return file.getFRIFilePath(result); });
    addKind(
        path, session, options, "jnl", "The journal of the machine",
        [](const ISCSIEPFile& file, std::string& result) { return file.getJNLFilePath(result); },
        Command::Need::oneOrNone);
    path.add("map", "The map file of a LUN")
        .argument("LID", "LUN id", options->lid, parseNumber32)
        .action([options, &session] {
            Lun lun;
            if (session.succeeded(loadLun(session, options->lid, lun), subjectOf({options->lid, options->lid}))) {
                print(forReader(lun.mapPath) + "\n");
            }
        });
    addKind(path, session, options, "dat", "The data file that holds an extent address",
            [options](const ISCSIEPFile& file, std::string& result) {
                constexpr auto limit = static_cast<std::uint64_t>(std::numeric_limits<std::int64_t>::max());
                if (options->extentAddress > limit / options->extentSize) {
                    errno = 0;
                    return ISCSI::TOOL::EP_ERR_SEEK_FAILED;
                }
                return file.getDATFilePath(options->extentSize, options->extentAddress, result);
            })
        .option("--extent-size", "SIZE", "Bytes of an extent; K, M, G or KiB, MiB, GiB may follow", options->extentSize,
                parseExtentSize, Command::Need::one)
        .option("--extent-address", "N", "Extent address, as a map entry holds it", options->extentAddress, parseNumber,
                Command::Need::one);
}

}  // namespace epinspect
