#include "store/LunBytes.h"

#include <algorithm>
#include <cerrno>
#include <cstring>
#include <tuple>
#include <utility>

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

constexpr std::uint64_t entriesAtOnce = 4096;
constexpr std::uint64_t smallestPiece = 4096;  ///< of a file, where some of it cannot be read

/// How messages name the bytes from `begin` up to `end`, not including it.
std::string bytesText(std::uint64_t begin, std::uint64_t end) {
    const std::string first = std::to_string(begin);
    return end - begin == 1 ? "byte " + first : "bytes " + first + "-" + std::to_string(end - 1);
}

LunPart unreadable(std::uint64_t offset, std::uint64_t length, Failure failure) {
    return {LunPart::Kind::unreadable, offset, length, 0, 0, std::move(failure)};
}

Failure readFailure(const std::string& file, std::string what) {
    return {{file, ""}, tool::EP_ERR_READ_FAILED, 0, std::move(what)};
}

Failure pastDataEnd(const DataFile& data) {
    return readFailure(data.path,
                       "past the end, the file holds " + std::to_string(data.dataSize) + " bytes of extents");
}

Failure ambiguousPlace(const DataFile& data) {
    return {{data.path, ""},
            tool::EP_ERR_NO_PATH,
            0,
            "ambiguous: extents may be counted within the data file or from the volume's start, and both places lie "
            "inside the file; --count-from decides"};
}

}  // namespace

bool LunPart::continuesWith(const LunPart& next) const {
    const auto why = [](const Failure& f) { return std::tie(f.subject.file, f.what, f.error, f.reason); };
    if (next.kind != kind || next.offset != end()) return false;
    if (kind == Kind::data) return next.dataFile == dataFile && next.position == position + length;
    return why(next.failure) == why(failure);
}

/// Merges parts that are alike on their way to each().
class LunBytes::Parts {
public:
    Parts(std::uint64_t offset, std::uint64_t end, const Each& each) : at_(offset), end_(end), each_(each) {}

    /// The next byte that no part has yet, and the end of all, not included.
    std::uint64_t at() const { return at_; }
    std::uint64_t end() const { return end_; }

    /// Takes the next `length` bytes. Like the others returns whether to go on.
    bool addHole(std::uint64_t length) { return add({LunPart::Kind::hole, at_, length}); }
    bool addUnreadable(std::uint64_t length, const Failure& failure) { return add(unreadable(at_, length, failure)); }
    bool addData(std::uint64_t length, std::uint64_t dataFile, std::uint64_t position) {
        return add({LunPart::Kind::data, at_, length, dataFile, position});
    }

    /// Hands out what waits for a part like it.
    bool flush() {
        const auto part = std::exchange(waiting_, std::nullopt);
        return !part || each_(*part);
    }

private:
    bool add(const LunPart& part) {
        at_ += part.length;
        if (part.length == 0) return true;
        if (waiting_ && waiting_->continuesWith(part)) {
            waiting_->length += part.length;
            return true;
        }
        const bool goOn = flush();
        waiting_ = part;
        return goOn;
    }

    std::uint64_t at_;
    std::uint64_t end_;
    const Each& each_;
    std::optional<LunPart> waiting_;
};

LunBytes::LunBytes(Context& context, const LunMap& lun, const PlaceChoice& choice)
    : lun_(lun), choice_(choice), files_(context, lun.targetPath, true) {}

void LunBytes::forEachPart(std::uint64_t offset, std::uint64_t length, const Each& each) {
    files_.lookAgain();
    const std::uint64_t size = lun_.extentSize;
    const std::uint64_t mapEnd = std::min(lun_.mappableSize(), offset + length);
    Parts parts(offset, offset + length, each);
    std::vector<MapEntry> entries;
    while (parts.at() < mapEnd) {
        const std::uint64_t first = parts.at() / size;
        const int error = readEntries(first, (mapEnd - 1) / size, entries);
        const int reason = errno;
        bool goOn = true;
        if (error != 0) {
            const std::uint64_t lost = std::min(mapEnd, (first + entries.size()) * size) - parts.at();
            goOn = parts.addUnreadable(lost, {{lun_.file, ""}, error, reason, ""});
        } else if (entries.empty()) {
            goOn = parts.addUnreadable(mapEnd - parts.at(),
                                       readFailure(lun_.file, "the file has become shorter while it was read"));
        } else {
            MapRuns runs;
            const auto add = [&](const MapRun& run) { goOn = goOn && addRun(parts, run); };
            runs.add(first, entries, add);
            runs.finish(add);
        }
        // Handed out even if the next entries could continue it, so that each() is called now and then.
        if (!goOn || !parts.flush()) return;
    }
    const Failure pastMap = lun_.pastMap("");
    if (parts.addUnreadable(parts.end() - parts.at(), {{pastMap.subject.file, ""}, pastMap.error, 0, pastMap.what})) {
        parts.flush();
    }
}

/// Reads some of the entries from `first` to `last`; none where the file has ended. After a failure `entries` has the
/// size of what is lost, from `first` on.
int LunBytes::readEntries(std::uint64_t first, std::uint64_t last, std::vector<MapEntry>& entries) {
    const std::uint64_t wanted = std::min(last - first + 1, entriesAtOnce);
    entries.clear();
    int error = lun_.map->getMapEntries(first, wanted, entries);
    if (error != tool::EP_ERR_READ_FAILED || errno == 0) {
        if (error != 0) entries.resize(static_cast<std::size_t>(wanted));
        return error;
    }
    // A block of the disk that cannot be read does not take its neighbours along.
    const std::uint64_t inBlock =
        std::max<std::uint64_t>((smallestPiece - entryOffset(*lun_.map, first) % smallestPiece) / entrySize, 1);
    const std::uint64_t count = std::min(wanted, inBlock);
    error = lun_.map->getMapEntries(first, count, entries);
    if (error != 0) entries.resize(static_cast<std::size_t>(count));
    return error;
}

bool LunBytes::addRun(Parts& parts, const MapRun& run) {
    const std::uint64_t size = lun_.extentSize;
    const std::uint64_t end = std::min(parts.end(), (run.first + run.count) * size);
    if (!run.entry.mapped) return parts.addHole(end - parts.at());
    const auto address = extentAddressOf(run.entry, choice_);
    if (!address) {
        return parts.addUnreadable(end - parts.at(), {{}, tool::EP_ERR_NO_PATH, 0, ambiguousAddressText(run.entry)});
    }
    while (parts.at() < end) {
        const auto place = placeOf(*address + (parts.at() / size - run.first), lun_.extentSize);
        if (!place) return parts.addUnreadable(end - parts.at(), {{}, tool::EP_ERR_SEEK_FAILED, 0, ""});
        const std::uint64_t offset = parts.at() % size;
        const std::uint64_t inFile = (place->next - place->inVolume) * size - offset;
        if (!addExtents(parts, *place, offset, std::min(end - parts.at(), inFile))) return false;
    }
    return true;
}

/// Of extents in one data file, `length` bytes from `offset` in the first one.
bool LunBytes::addExtents(Parts& parts, const ExtentPlace& place, std::uint64_t offset, std::uint64_t length) {
    const DataFile& data =
        files_.at(place.dataFile);  // holds until a part is added: reading it may open the file again
    if (data.failure) return parts.addUnreadable(length, *data.failure);
    std::uint64_t ambiguous = 0;
    auto counting = countingOf(place, lun_.extentSize, offset, data.dataSize, choice_);
    if (!counting) {  // up to where only one of the two places lies inside the file
        ambiguous = std::min(length, data.dataSize - (place.inVolume * lun_.extentSize + offset));
        counting = CountFrom::file;
    }
    length -= ambiguous;
    const std::uint64_t position = place.counted(*counting) * lun_.extentSize + offset + ambiguous;
    const std::uint64_t there = position < data.dataSize ? std::min(length, data.dataSize - position) : 0;
    const std::uint64_t held = position < data.held ? std::min(there, data.held - position) : 0;
    const Failure undecided = ambiguous > 0 ? ambiguousPlace(data) : Failure();
    const Failure past = there < length ? pastDataEnd(data) : Failure();
    const Failure elsewhere = held < there ? readFailure(data.path, notCollectedText) : Failure();
    return parts.addUnreadable(ambiguous, undecided) && parts.addData(held, place.dataFile, position) &&
           parts.addUnreadable(there - held, elsewhere) && parts.addUnreadable(length - there, past);
}

bool LunBytes::readData(const LunPart& part, unsigned char* bytes, const Each& missing) {
    // getExtentBytes() reads inside an "extent", whose number and size are free to choose.
    constexpr std::uint64_t largest = std::uint64_t{1} << 30U;
    const std::uint64_t inFirst = std::min(part.length, largest - part.position % largest);
    return readPiece(part.dataIn(0, inFirst), bytes, missing) &&
           (inFirst == part.length || readPiece(part.dataIn(inFirst, part.length - inFirst), bytes + inFirst, missing));
}

/// A piece inside one of these "extents".
bool LunBytes::readPiece(const LunPart& part, unsigned char* bytes, const Each& missing) {
    constexpr std::uint32_t size = 1U << 30U;
    const DataFile& data = files_.at(part.dataFile);
    Failure failure;
    if (data.failure) {
        failure = *data.failure;
    } else {
        const int error =
            data.file->getExtentBytes(part.position / size, size, static_cast<std::uint32_t>(part.position % size),
                                      static_cast<std::uint32_t>(part.length), bytes);
        const int reason = errno;
        if (error == 0) return true;
        if (error == tool::EP_ERR_READ_FAILED && reason == 0) return readRest(part, bytes, missing);
        const std::uint64_t inFile = data.file->head0DataStartOffset + part.position;
        const std::uint64_t firstBlock = smallestPiece - inFile % smallestPiece;
        if (error == tool::EP_ERR_READ_FAILED && part.length > firstBlock) {
            const std::uint64_t blocks = (part.length - firstBlock + smallestPiece - 1) / smallestPiece;
            const std::uint64_t half = firstBlock + blocks / 2 * smallestPiece;
            return readPiece(part.dataIn(0, half), bytes, missing) &&
                   readPiece(part.dataIn(half, part.length - half), bytes + half, missing);
        }
        failure = {{data.path, ""}, error, reason, ""};
    }
    std::memset(bytes, 0, static_cast<std::size_t>(part.length));
    return missing(unreadable(part.offset, part.length, std::move(failure)));
}

/// The file has become shorter than the end of `part` since it was looked at: reads what is left.
bool LunBytes::readRest(const LunPart& part, unsigned char* bytes, const Each& missing) {
    files_.lookAgain();
    const DataFile& data = files_.at(part.dataFile);
    const std::uint64_t there = data.held > part.position ? data.held - part.position : 0;
    if (!data.failure && there > 0 && there < part.length) {
        if (!readPiece(part.dataIn(0, there), bytes, missing)) return false;
        return readRest(part.dataIn(there, part.length - there), bytes + there, missing);
    }
    std::memset(bytes, 0, static_cast<std::size_t>(part.length));
    const Failure ended =
        there == 0 ? pastDataEnd(data) : readFailure(data.path, "the file has become shorter while it was read");
    return missing(unreadable(part.offset, part.length, data.failure.value_or(ended)));
}

bool LunBytes::read(std::uint64_t offset, std::uint64_t length, unsigned char* bytes, const Each& missing) {
    bool goOn = true;
    forEachPart(offset, length, [&](const LunPart& part) {
        unsigned char* const here = bytes + (part.offset - offset);
        if (part.kind == LunPart::Kind::data) {
            goOn = readData(part, here, missing);
        } else {
            std::memset(here, 0, static_cast<std::size_t>(part.length));
            goOn = part.kind == LunPart::Kind::hole || missing(part);
        }
        return goOn;
    });
    return goOn;
}

void LunBytes::noticeChanges() const {
    if (lun_.watch) lun_.watch->noticeChange();
    files_.noticeChanges();
}

Failure LunBytes::failureOf(const LunPart& part) const {
    Failure failure = part.failure;
    const Subject subject = lun_.subject(bytesText(part.offset, part.end()));
    failure.subject.part = subject.part;
    if (failure.subject.file.empty()) failure.subject.file = subject.file;
    return failure;
}

}  // namespace inspection
