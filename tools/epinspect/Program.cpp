#include "Program.h"

#include <cerrno>
#include <csignal>
#include <cstring>
#include <exception>
#include <new>

#include "commands/Commands.h"
#include "frame/CommandLine.h"
#include "frame/Interruption.h"
#include "frame/Output.h"

namespace epinspect {

namespace {

int run(int argc, char** argv) {
    Session session;
    CommandLine line("epinspect", "Shows what the EP files of an iSCSI LUN store hold", EPINSPECT_VERSION);

    Command& program = line.program();
    program.group("Files of a store");
    addList(program, session);
    addDump(program, session);
    addCheck(program, session);
    addUsage(program, session);
    addCollect(program, session);
    program.group("Entries of a map");
    addMap(program, session);
    addEntry(program, session);
    addDiff(program, session);
    addFind(program, session);
    program.group("Bytes");
    addLocate(program, session);
    addOwner(program, session);
    addRead(program, session);
    addExtent(program, session);
    program.group("Configuration and paths");
    addLun(program, session);
    addPath(program, session);

    std::string root;
    line.everywhere()
        .option("--root", "DIR", "Folder that stands for / of the target", root,
                [&session](const std::string& folder) {
                    session.setRoot(folder);
                    return folder;
                })
        .flag("-v, --verbose", "Show the library's log lines on standard error", showLogLines);

    line.beforeAction([&session] {
        if (session.damagedCollection) session.failed(*session.damagedCollection);
        return !session.damagedCollection;
    });
    if (!line.run(argc, argv)) return 2;
    finishOutput();
    return session.status();
}

}  // namespace

int runProgram(int argc, char** argv) {
    try {
        return run(argc, argv);
    } catch (const OutputFailure& failure) {
        if (failure.error != EPIPE) complainPlainly({"standard output: ", std::strerror(failure.error)});
    } catch (const Interrupted& interrupted) {
        static_cast<void>(std::raise(interrupted.signal));  // what it does by default: the shell can tell
    } catch (const std::bad_alloc&) {
        complainPlainly({"out of memory"});
    } catch (const std::exception& error) {
        complainPlainly({error.what()});
    }
    return 1;
}

}  // namespace epinspect
