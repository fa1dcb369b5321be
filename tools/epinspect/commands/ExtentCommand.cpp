// epinspect extent: the bytes of one extent of a data file.
#include <ISCSIEPFileDAT.h>
#include <etc/ISCSIQuorinStringTool.h>

#include <algorithm>
#include <memory>
#include <vector>

#include "commands/Commands.h"
#include "commands/MapArguments.h"
#include "frame/Numbers.h"
#include "frame/Output.h"
#include "store/Doubts.h"
#include "store/FileSize.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

struct ExtentOptions {
    std::string file;
    std::uint64_t index = 0;
    std::uint32_t extentSize = 0;
    bool raw = false;
};

/// How many whole extents the file holds, or nothing when its size cannot be found out.
std::optional<std::uint64_t> extentCount(const Session& session, const tool::ISCSIEPFileDAT& file,
                                         std::uint32_t extentSize) {
    const auto size = session.sizeOf(file.path);
    if (!size) return std::nullopt;
    return payloadOf(file, *size) / extentSize;
}

/// Whether the bytes of the extent are here; in a collection they are not.
bool isHeld(const Session& session, const tool::ISCSIEPFileDAT& file, const ExtentOptions& options) {
    if (!session.collection) return true;
    return payloadOf(file, sizeOf(file.path).value_or(0)) / options.extentSize > options.index;
}

/// Prints the extent block by block, so that its size does not matter. Returns 0 or the code of the read that failed.
int printExtent(const ExtentOptions& options, Session& session, tool::ISCSIEPFileDAT& file) {
    constexpr unsigned int blockSize = 256U << 10U;
    const unsigned int size = std::min(options.extentSize, blockSize);
    std::vector<unsigned char> bytes(size);
    std::string digits(options.raw ? 0 : 2 * std::size_t{size}, '\0');
    for (unsigned int offset = 0; offset < options.extentSize;) {
        const unsigned int length = std::min(options.extentSize - offset, blockSize);
        const int error = file.getExtentBytes(options.index, options.extentSize, offset, length, bytes.data());
        if (error != 0) return error;
        if (options.raw) {
            print({reinterpret_cast<const char*>(bytes.data()), length});
        } else {
            tool::PutHexDigits(bytes.data(), length, digits.data());
            print({digits.data(), 2 * std::size_t{length}});
        }
        offset += length;
        session.progress("bytes", offset, options.extentSize);
    }
    if (!options.raw) print("\n");
    return 0;
}

void run(const ExtentOptions& options, Session& session) {
    if (options.raw && outputIsTerminal()) throw UsageError{"--raw: standard output is a terminal"};
    const std::optional<std::string> path = session.openablePath(options.file, NamedBy::user);
    if (!path) return;
    tool::ISCSIEPFileDAT file(*path);
    const std::string place = "extent " + std::to_string(options.index);
    // Nothing is read yet: this tells whether there can be extents at all.
    if (!session.succeeded(file.getExtentBytes(0, options.extentSize, 0, 0, nullptr), {options.file, place})) return;
    remarkOnDataStart(session, file, options.file);
    const auto count = extentCount(session, file, options.extentSize);
    if (!count) {
        session.succeeded(tool::EP_ERR_OPEN_FAILED, {options.file, place});
    } else if (options.index >= *count) {
        session.failed(pastEnd(options.file, place, *count));
    } else if (!isHeld(session, file, options)) {
        session.fail({options.file, place}, notCollectedText, tool::EP_ERR_READ_FAILED);
    } else {
        session.succeeded(printExtent(options, session, file), {options.file, place});
    }
}

}  // namespace

void addExtent(Command& parent, Session& session) {
    const auto options = std::make_shared<ExtentOptions>();
    parent.add("extent", "Show one extent of a data file in hexadecimal")
        .argument("DATFILE", "Data file of a volume", options->file)
        .argument("INDEX", "Number of the extent in the file, from 0", options->index, parseNumber)
        .option("--extent-size", "SIZE", "Bytes of an extent; K, M, G or KiB, MiB, GiB may follow", options->extentSize,
                parseExtentSize, Command::Need::one)
        .flag("--raw", "The bytes themselves", options->raw)
        .action([options, &session] { run(*options, session); });
}

}  // namespace epinspect
