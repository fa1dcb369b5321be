// epinspect extent: the bytes of one extent of a data file.
#include <ISCSIEPFileDAT.h>

#include <CLI/App.hpp>
#include <memory>

#include "Numbers.h"
#include "Output.h"
#include "commands/Commands.h"

namespace epinspect {

namespace {

struct ExtentOptions {
    std::string file;
    std::uint64_t index = 0;
    std::uint32_t extentSize = 0;
    bool raw = false;
};

unsigned int valueOf(char digit) { return static_cast<unsigned int>(digit <= '9' ? digit - '0' : digit - 'a' + 10); }

/// The bytes that the library's hexadecimal text stands for, in place of it.
void toBytes(std::string& hex) {
    for (std::size_t i = 0; i < hex.size() / 2; ++i) {
        hex[i] = static_cast<char>(valueOf(hex[2 * i]) << 4U | valueOf(hex[2 * i + 1]));
    }
    hex.resize(hex.size() / 2);
}

void run(const ExtentOptions& options, Session& session) {
    if (options.raw && outputIsTerminal()) {
        throw CLI::ValidationError("--raw", "standard output is a terminal");
    }
    const std::optional<std::string> path = session.openablePath(options.file);
    if (!path) return;
    ISCSI::TOOL::ISCSIEPFileDAT file(*path);
    std::string data;
    const int error = file.getExtentData(options.index, options.extentSize, data);
    if (!session.succeeded(error, options.file + ": extent " + std::to_string(options.index))) return;
    if (options.raw) toBytes(data);
    print(data);
    if (!options.raw) print("\n");
}

}  // namespace

void addExtent(CLI::App& app, Session& session) {
    const auto options = std::make_shared<ExtentOptions>();
    CLI::App* command = app.add_subcommand("extent", "Show one extent of a data file in hexadecimal");
    command->add_option("DATFILE", options->file, "Data file of a volume")->required()->type_name("");
    addParsed(command, "INDEX", "Number of the extent in the file", options->index, parseNumber)->required();
    addParsed(command, "--extent-size", "Bytes of an extent; K, M or G may follow", options->extentSize, parseSize)
        ->required();
    command->add_flag("--raw", options->raw, "The bytes themselves");
    command->callback([options, &session] { run(*options, session); });
}

}  // namespace epinspect
