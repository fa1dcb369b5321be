// epinspect read: the bytes of a LUN.
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <limits>
#include <memory>
#include <new>

#include "commands/Commands.h"
#include "commands/LunCopy.h"
#include "commands/MapArguments.h"
#include "commands/PlaceOptions.h"
#include "frame/Interruption.h"
#include "frame/Json.h"
#include "frame/Numbers.h"
#include "frame/Output.h"
#include "store/HostFile.h"
#include "store/LunMap.h"

namespace epinspect {

namespace {

struct ReadOptions {
    PlaceOptions place;
    std::uint64_t offset = 0;
    std::optional<std::uint64_t> length;
    std::optional<std::string> output;
};

/// Zeros stand for what is skipped.
class OutputSink : public LunSink {
public:
    void put(std::string_view bytes) override { print(bytes); }

    std::uint64_t skip(std::uint64_t length) override {
        static const std::string zeros(std::size_t{1} << 20U, '\0');
        const auto count = static_cast<std::size_t>(std::min<std::uint64_t>(length, zeros.size()));
        print({zeros.data(), count});
        return count;
    }
};

/// The image could not be written; `error` is the errno value.
struct ImageFailure {
    int error;
};

/// What is skipped takes no room.
class ImageSink : public LunSink {
public:
    explicit ImageSink(const Descriptor& image) : image_(image) {}

    void put(std::string_view bytes) override {
        if (const int error = writeAt(image_.number(), bytes.data(), bytes.size(), end_)) throw ImageFailure{error};
        end_ += bytes.size();
    }

    std::uint64_t skip(std::uint64_t length) override {
        end_ += length;
        return length;
    }

private:
    const Descriptor& image_;
    std::uint64_t end_ = 0;
};

void reportMissing(Session& session, const LunMap& lun, const LunTotals& totals) {
    if (totals.missing == 0) return;
    session.remark(textOf(lun.subject("")), std::to_string(totals.missing) + " of " + std::to_string(totals.all()) +
                                                " bytes could not be read, zeros stand in their place");
}

/// Ends an image that cannot be finished after its last byte that is right, or removes it. Reports that, and why.
void giveUp(Session& session, const std::string& path, const Descriptor& image, const LunTotals& totals,
            std::uint64_t length, int error) {
    session.endProgress();
    const std::string done = std::to_string(totals.all());
    std::string what = "incomplete, it holds the first " + done + " of " + std::to_string(length) + " bytes";
    if (totals.data == 0) {
        unlink(path.c_str());
        what = "removed, nothing was written to it";
    } else if (ftruncate(image.number(), static_cast<off_t>(totals.all())) != 0) {
        what = "incomplete, only the first " + done + " bytes are right";
    }
    const bool interrupted = isInterrupted();
    session.failed({{path, ""}, 0, interrupted ? 0 : error, interrupted ? "interrupted: " + what : what});
}

void printSummary(const Session& session, const std::string& path, const LunMap& lun, const LunTotals& totals) {
    if (!session.json) {
        print(forReader(path) + ": " + counted(totals.all(), "byte", "bytes") + ": " + std::to_string(totals.data) +
              " data, " + std::to_string(totals.holes) + " holes, " + std::to_string(totals.missing) + " missing\n");
        return;
    }
    Json json(lun.file, lun.lids);
    json.begin("summary")
        .boolean("summary", true)
        .path("output", path)
        .number("bytes", totals.all())
        .number("data", totals.data)
        .number("holes", totals.holes)
        .number("missing", totals.missing)
        .texts("changed", session.changedFiles())
        .end();
}

void setSize(const Descriptor& image, std::uint64_t size) {
    if (size > static_cast<std::uint64_t>(std::numeric_limits<off_t>::max())) throw ImageFailure{EFBIG};
    if (ftruncate(image.number(), static_cast<off_t>(size)) != 0) throw ImageFailure{errno};
}

void writeImage(const ReadOptions& options, Session& session, const LunMap& lun, std::uint64_t length) {
    const std::string& path = *options.output;
    Descriptor image(open(path.c_str(), O_WRONLY | O_CREAT | O_EXCL | O_CLOEXEC, 0666));
    if (!image.isOpen()) return session.failed({{path, ""}, 0, errno, "cannot be made"});
    ImageSink sink(image);
    LunCopy copy(session, lun, options.place.choice, sink);
    const auto end = [&](int error) { giveUp(session, path, image, copy.totals(), length, error); };
    try {
        setSize(image, length);
        copy.run(options.offset, length);
        if (const int error = image.close()) throw ImageFailure{error};
    } catch (const ImageFailure& failure) {
        return end(failure.error);
    } catch (const Interrupted&) {
        return end(EINTR);
    } catch (const std::bad_alloc&) {
        return end(ENOMEM);
    } catch (const OutputFailure& failure) {
        end(0);
        throw;
    }
    if (length > 0 && copy.totals().missing == length) {
        unlink(path.c_str());
        session.remark(path, "removed, nothing could be read");
        return;
    }
    reportMissing(session, lun, copy.totals());
    printSummary(session, path, lun, copy.totals());
}

void writeOutput(const ReadOptions& options, Session& session, const LunMap& lun, std::uint64_t length) {
    OutputSink sink;
    LunCopy copy(session, lun, options.place.choice, sink);
    copy.run(options.offset, length);
    reportMissing(session, lun, copy.totals());
}

void run(const ReadOptions& options, Session& session) {
    if (session.json && !options.output) throw UsageError{"--json needs --output"};
    if (!options.output && outputIsTerminal()) throw UsageError{"standard output is a terminal, not a file or a pipe"};
    const std::optional<LunMap> lun = openLunMap(session, options.place.map, options.place.extentSize);
    if (!lun) return;
    const std::uint64_t there = lun->size - std::min(lun->size, options.offset);
    if (there == 0 && (options.offset > 0 || options.length > 0U)) {
        return session.failed(lun->pastEnd("byte " + std::to_string(options.offset)));
    }
    if (options.length > there) return session.failed(lun->pastEnd("byte " + std::to_string(lun->size)));
    const std::uint64_t length = options.length.value_or(there);
    session.listing = session.json;
    if (options.output) {
        writeImage(options, session, *lun, length);
    } else {
        writeOutput(options, session, *lun, length);
    }
}

}  // namespace

void addRead(Command& parent, Session& session) {
    const auto options = std::make_shared<ReadOptions>();
    Command& command = parent.add("read", "Write a LUN's bytes; bytes that cannot be read become zeros");
    addMapArgument(command, options->place.map);
    command
        .option("--offset", "SIZE", "Byte to start at (default: 0); K, M, G, T or KiB, MiB, GiB, TiB may follow",
                options->offset, parseSize)
        .option("--length", "SIZE", "Bytes to write (default: all to the end of the LUN)", options->length, parseSize)
        .option("--output", "FILE", "Write a new file, with holes for what is not mapped or cannot be read",
                options->output, [](const std::string& text) { return text; })
        .flag("--json", "With --output: one JSON object per range that cannot be read, then a summary", session.json);
    addPlaceOptions(command, options->place.extentSize, options->place.choice);
    command.action([options, &session] { run(*options, session); });
}

}  // namespace epinspect
