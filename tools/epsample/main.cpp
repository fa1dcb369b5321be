// epsample: writes a sample LUN store to try the tools on.
#include <getopt.h>

#include <cerrno>
#include <charconv>
#include <csignal>
#include <cstdint>
#include <exception>
#include <filesystem>
#include <iostream>
#include <new>
#include <optional>
#include <set>
#include <stdexcept>
#include <string>
#include <system_error>

#include "BrokenStore.h"
#include "DiskStore.h"
#include "SampleStore.h"
#include "StoreFiles.h"

namespace {

constexpr const char* help = R"(Usage: epsample [--map-entries N] DIR
       epsample --broken DIR
       epsample --disk IMAGE DIR

Writes a LUN store to try the tools on below DIR, a new or empty folder that
stands for / of the target: journal, LUN list, and the files of two volumes,
the same at each run.

  --map-entries N   entries of the map file of LUN 1, 4096 if not given; each
                    is 1 MiB of the LUN
  --broken          write a store in which one thing of each kind is wrong
  --disk IMAGE      write a store whose LUN 1 holds the bytes of the file IMAGE
  -h, --help        show this text
  -V, --version     show the version
)";

struct WrongUsage : std::runtime_error {
    using std::runtime_error::runtime_error;
};

enum class Action { write, writeBroken, writeDisk, showHelp, showVersion };

struct Wanted {
    Action action = Action::write;
    std::optional<std::uint64_t> mapEntries;
    std::string image;
    std::string root;
};

std::uint64_t parseEntries(const std::string& text) {
    const bool hexadecimal = text.compare(0, 2, "0x") == 0 || text.compare(0, 2, "0X") == 0;
    const char* end = text.data() + text.size();
    std::uint64_t number = 0;
    const auto result = std::from_chars(text.data() + (hexadecimal ? 2 : 0), end, number, hexadecimal ? 16 : 10);
    if (result.ec != std::errc() || result.ptr != end || number > epsample::mostMapEntries) {
        throw WrongUsage("--map-entries: '" + text + "' is not a number from 0 to " +
                         std::to_string(epsample::mostMapEntries));
    }
    return number;
}

/// Reads the command line; getopt_long() itself says which option is wrong.
Wanted parse(int argc, char** argv) {
    static char program[] = "epsample";
    static const option options[] = {
        {"map-entries", required_argument, nullptr, 'm'}, {"broken", no_argument, nullptr, 'b'},
        {"disk", required_argument, nullptr, 'd'},        {"help", no_argument, nullptr, 'h'},
        {"version", no_argument, nullptr, 'V'},           {nullptr, 0, nullptr, 0}};
    if (argc > 0) argv[0] = program;
    Wanted wanted;
    std::set<std::string> chosen;
    for (int found = 0; (found = getopt_long(argc, argv, "hV", options, nullptr)) != -1;) {
        if (found == 'h') return {Action::showHelp, {}, {}, {}};
        if (found == 'V') return {Action::showVersion, {}, {}, {}};
        if (found == 'b') chosen.insert("--broken");
        if (found == 'd') chosen.insert("--disk");
        if (found == 'd') wanted.image = optarg;
        if (found == 'm') chosen.insert("--map-entries");
        if (found == 'm') wanted.mapEntries = parseEntries(optarg);
        if (found == '?') throw WrongUsage("");
    }
    if (optind >= argc || *argv[optind] == '\0') throw WrongUsage("DIR is missing");
    if (optind + 1 < argc) throw WrongUsage("'" + std::string(argv[optind + 1]) + "': only one DIR is possible");
    if (chosen.size() > 1) throw WrongUsage(*chosen.rbegin() + " and " + *chosen.begin() + " exclude each other");
    if (chosen.count("--broken") > 0) wanted.action = Action::writeBroken;
    if (chosen.count("--disk") > 0) wanted.action = Action::writeDisk;
    wanted.root = argv[optind];
    return wanted;
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
    } catch (const std::bad_alloc&) {
        complain("not enough memory");
    } catch (const std::exception& error) {
        complain(error.what());
    }
    return false;
}

bool writeStore(const Wanted& wanted) {
    if (!succeeds([&wanted] { epsample::makeRoot(wanted.root); })) return false;
    const bool written = succeeds([&wanted] {
        if (wanted.action == Action::writeBroken) {
            epsample::writeBrokenStore(wanted.root);
        } else if (wanted.action == Action::writeDisk) {
            epsample::writeDiskStore(wanted.root, wanted.image);
        } else {
            epsample::writeSampleStore(wanted.root, wanted.mapEntries.value_or(4096));
        }
    });
    if (!written) complain(wanted.root + ": what has been written is not a whole store");
    return written;
}

bool print(const char* text) {
    std::cout << text << std::flush;
    if (!std::cout) complain("standard output: " + std::generic_category().message(errno));
    return std::cout.good();
}

bool run(const Wanted& wanted) {
    switch (wanted.action) {
        case Action::showHelp:
            return print(help);
        case Action::showVersion:
            return print("epsample " EPSAMPLE_VERSION "\n");
        default:
            return writeStore(wanted);
    }
}

}  // namespace

int main(int argc, char** argv) {
    std::signal(SIGXFSZ, SIG_IGN);  // a limit on the size of files is a failed write like others
    int status = 1;
    succeeds([&] {
        try {
            status = run(parse(argc, argv)) ? 0 : 1;
        } catch (const WrongUsage& error) {
            if (*error.what() != '\0') complain(error.what());
            std::cerr << "Try 'epsample --help'.\n";
            status = 2;
        }
    });
    return status;
}
