// epsample: writes a sample LUN store to try the tools on.
#include <CLI/App.hpp>
#include <CLI/Config.hpp>
#include <CLI/Formatter.hpp>
#include <charconv>
#include <csignal>
#include <cstdint>
#include <exception>
#include <filesystem>
#include <iostream>
#include <string>

#include "BrokenStore.h"
#include "SampleStore.h"
#include "StoreFiles.h"

namespace {

struct Wanted {
    std::string root;
    std::uint64_t mapEntries = 4096;
    bool broken = false;
};

std::uint64_t parseEntries(const std::string& text) {
    const bool hexadecimal = text.compare(0, 2, "0x") == 0;
    const char* end = text.data() + text.size();
    std::uint64_t number = 0;
    const auto result = std::from_chars(text.data() + (hexadecimal ? 2 : 0), end, number, hexadecimal ? 16 : 10);
    if (result.ec != std::errc() || result.ptr != end || number > epsample::mostMapEntries) {
        throw CLI::ValidationError(
            "--map-entries", "'" + text + "' is not a number from 0 to " + std::to_string(epsample::mostMapEntries));
    }
    return number;
}

void addOptions(CLI::App& app, Wanted& wanted) {
    app.set_version_flag("-V,--version", "epsample " EPSAMPLE_VERSION);
    app.add_option("DIR", wanted.root, "Folder that stands for / of the target; new or empty")
        ->required()
        ->check([](const std::string& root) { return root.empty() ? "is empty" : ""; }, "");
    auto* const entries = app.add_option_function<std::string>(
        "--map-entries", [&wanted](const std::string& text) { wanted.mapEntries = parseEntries(text); },
        "Entries of the map file of LUN 1, 1 MiB of the LUN each; 4096 if not given");
    entries->type_name("N");
    app.add_flag("--broken", wanted.broken, "Write a store with one fault of each kind instead")
        ->disable_flag_override()
        ->excludes(entries);
}

void complain(const std::string& message) { std::cerr << "epsample: " << message << '\n'; }

/// Performs `work`; complains and returns false where it fails.
template <typename Work>
bool succeeds(const Work& work) {
    try {
        work();
        return true;
    } catch (const std::filesystem::filesystem_error& error) {
        complain(error.path1().string() + ": " + error.code().message());
    } catch (const std::exception& error) {
        complain(error.what());
    }
    return false;
}

int writeStore(const Wanted& wanted) {
    if (!succeeds([&wanted] { epsample::makeRoot(wanted.root); })) return 1;
    const bool written = succeeds([&wanted] {
        if (wanted.broken) {
            epsample::writeBrokenStore(wanted.root);
        } else {
            epsample::writeSampleStore(wanted.root, wanted.mapEntries);
        }
    });
    if (!written) complain(wanted.root + ": what has been written is not a whole store");
    return written ? 0 : 1;
}

int printed(const std::string& text) {
    std::cout << text << std::flush;
    if (std::cout) return 0;
    complain("standard output cannot be written");
    return 1;
}

int run(int argc, char** argv) {
    CLI::App app("Writes a small LUN store below a folder, the same at each run.", "epsample");
    Wanted wanted;
    addOptions(app, wanted);
    try {
        app.parse(argc, argv);
    } catch (const CLI::CallForHelp&) {
        return printed(app.help());
    } catch (const CLI::CallForVersion& version) {
        return printed(version.what() + std::string("\n"));
    } catch (const CLI::ParseError& error) {
        complain(error.what() + std::string("\nTry 'epsample --help'."));
        return 2;
    }
    return writeStore(wanted);
}

}  // namespace

int main(int argc, char** argv) {
    std::signal(SIGXFSZ, SIG_IGN);  // a limit on the size of files is a failed write like others
    int status = 1;
    succeeds([&] { status = run(argc, argv); });
    return status;
}
