// epinspect: shows what EP files hold, and never writes one.
#include <CLI/App.hpp>
#include <CLI/Config.hpp>
#include <CLI/Formatter.hpp>
#include <cerrno>
#include <clocale>
#include <csignal>
#include <exception>
#include <system_error>

#include "Output.h"
#include "commands/Commands.h"

namespace {

using namespace epinspect;

void addCommonOptions(CLI::App& app, Session& session) {
    app.fallthrough();
    app.require_subcommand(1);
    app.footer("--root, -v and --help may stand after the subcommand too.");
    app.set_version_flag("--version", "epinspect " EPINSPECT_VERSION);
    app.add_flag_callback("-v,--verbose", showLogLines, "Show the library's log lines on standard error");
    app.add_option_function<std::string>(
           "--root", [&session](const std::string& root) { session.setRoot(root); },
           "Folder that stands for / of the target")
        ->type_name("DIR");
}

int run(int argc, char** argv) {
    CLI::App app("Shows what the EP files of an iSCSI LUN store hold.", "epinspect");
    Session session;
    addCommonOptions(app, session);
    for (const auto add : {addDump, addEntry, addMap, addExtent, addLun, addPath}) add(app, session);
    try {
        app.parse(argc, argv);
    } catch (const CLI::CallForVersion& version) {
        print(version.what() + std::string("\n"));
    } catch (const CLI::CallForHelp&) {
        print(app.help());
    } catch (const CLI::ParseError& error) {
        const bool unknown = app.get_subcommands().empty() && !app.remaining().empty();
        complain(unknown ? "unknown subcommand or option: " + app.remaining().front() : error.what());
        return 2;
    }
    finishOutput();
    return session.failed ? 1 : 0;
}

}  // namespace

int main(int argc, char** argv) {
    std::setlocale(LC_CTYPE, "");
    std::signal(SIGPIPE, SIG_IGN);
    try {
        return run(argc, argv);
    } catch (const OutputFailure& failure) {
        if (failure.error != EPIPE)
            complain(std::string("standard output: ") + std::generic_category().message(failure.error));
    } catch (const std::exception& error) {
        complain(error.what());
    }
    return 1;
}
