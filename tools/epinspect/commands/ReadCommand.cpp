// epinspect read: the bytes of a LUN.
#include <algorithm>
#include <memory>

#include "commands/Commands.h"
#include "commands/PlaceOptions.h"
#include "frame/Numbers.h"
#include "frame/Output.h"
#include "store/LunMap.h"
#include "store/LunReader.h"

namespace epinspect {

namespace {

struct ReadOptions {
    PlaceOptions place;
    std::uint64_t offset = 0;
    std::optional<std::uint64_t> length;
};

void run(const ReadOptions& options, Session& session) {
    if (outputIsTerminal()) throw UsageError{"standard output is a terminal, not a file or a pipe"};
    const std::optional<LunMap> lun = openLun(session, options.place);
    if (!lun) return;
    const std::uint64_t there = lun->size - std::min(lun->size, options.offset);
    if (there == 0 && (options.offset > 0 || options.length > 0U)) {
        return session.failed(lun->pastEnd("byte " + std::to_string(options.offset)));
    }
    if (options.length > there) return session.failed(lun->pastEnd("byte " + std::to_string(lun->size)));
    const std::uint64_t length = options.length.value_or(there);
    session.listing = false;
    const auto write = [](const unsigned char* bytes, std::size_t count) {
        print({reinterpret_cast<const char*>(bytes), count});
    };
    const std::uint64_t missing = LunReader(session, *lun, options.place.choice, options.offset, length, write).run();
    if (missing == 0) return;
    session.remark(textOf(lun->subject("")), std::to_string(missing) + " of " + std::to_string(length) +
                                                 " bytes could not be read, zeros stand in their place");
}

}  // namespace

void addRead(Command& parent, Session& session) {
    const auto options = std::make_shared<ReadOptions>();
    Command& command = parent.add("read", "Write a LUN's bytes; bytes that cannot be read become zeros");
    addLunArgument(command, options->place);
    command
        .option("--offset", "SIZE", "Byte to start at (default: 0); K, M, G, T or KiB, MiB, GiB, TiB may follow",
                options->offset, parseSize)
        .option("--length", "SIZE", "Bytes to write (default: all to the end of the LUN)", options->length, parseSize);
    addPlaceOptions(command, options->place);
    command.action([options, &session] { run(*options, session); });
}

}  // namespace epinspect
