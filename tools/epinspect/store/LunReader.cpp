#include "store/LunReader.h"

#include <algorithm>
#include <cerrno>
#include <tuple>
#include <utility>

#include "Output.h"
#include "map/MapWalk.h"
#include "store/FileSize.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

namespace {

constexpr std::uint32_t pieceSize = 1U << 20U;      ///< of a read
constexpr std::uint32_t smallestPiece = 1U << 12U;  ///< of a read in the neighbourhood of what cannot be read

/// How messages name the bytes from `begin` up to `end`, without that one.
std::string bytesText(std::uint64_t begin, std::uint64_t end) {
    const std::string first = std::to_string(begin);
    return end - begin == 1 ? "byte " + first : "bytes " + first + "-" + std::to_string(end - 1);
}

}  // namespace

LunReader::LunReader(Session& session, const LunMap& lun, const PlaceChoice& choice, std::uint64_t first,
                     std::uint64_t length)
    : session_(session),
      lun_(lun),
      choice_(choice),
      files_(session, lun.targetPath, lun.extentSize),
      progress_("bytes", length, Progress::Beside::nothing),
      buffer_(std::make_unique<Page[]>(pieceSize / sizeof(Page))),
      bytes_(buffer_[0].bytes),
      zeros_(pieceSize),
      first_(first),
      end_(first + length),
      at_(first) {}

void LunReader::print() {
    const std::uint64_t mapEnd = std::clamp(lun_.mappableSize(), first_, end_);
    // Said first: what follows may be long.
    if (mapEnd < end_) lun_.failBeyondMap(session_, bytesText(mapEnd, end_));
    try {
        if (first_ < mapEnd) printMap(mapEnd);
        reportMissing();
        missing_ += end_ - mapEnd;
        printZeros(end_ - mapEnd);
    } catch (const OutputFailure&) {
        reportMissing();
        throw;
    }
    if (missing_ == 0) return;
    const Subject subject = lun_.subject("");
    complain(subject.file + subject.part + ": " + std::to_string(missing_) + " of " + std::to_string(end_ - first_) +
             " bytes could not be read, zeros stand in their place");
}

/// The bytes up to `end` (without it), for which the map had entries when it was opened.
void LunReader::printMap(std::uint64_t end) {
    MapRuns runs;
    const auto each = [this](const MapRun& run) { printRun(run); };
    const WalkEnd walk = walkMap(*lun_.map, {first_ / lun_.extentSize, (end - 1) / lun_.extentSize},
                                 [&](std::uint64_t index, const auto& entries) { runs.add(index, entries, each); });
    runs.finish(each);
    if (walk.error != 0) {
        miss(end - at_, {lun_.file, "", walk.error, walk.reason});
    } else {
        miss(end - at_, {lun_.file, "the file has become shorter while it was read", tool::EP_ERR_READ_FAILED});
    }
}

void LunReader::printRun(const MapRun& run) {
    const std::uint64_t size = lun_.extentSize;
    const std::uint64_t end = std::min(end_, (run.first + run.count) * size);
    if (!run.entry.mapped) return printZeros(end - at_);
    const auto address = extentAddressOf(run.entry, choice_);
    if (!address) return miss(end - at_, {"", openAddressText(run.entry), tool::EP_ERR_NO_PATH});
    while (at_ < end) {
        const auto place = placeOf(*address + (at_ / size - run.first), lun_.extentSize);
        if (!place) return miss(end - at_, {"", "", tool::EP_ERR_SEEK_FAILED});
        const std::uint64_t offset = at_ % size;
        printExtents(*place, offset, std::min(end - at_, (place->next - place->inVolume) * size - offset));
    }
}

/// Of extents in one data file, `length` bytes from `offset` in the first one.
void LunReader::printExtents(const ExtentPlace& place, std::uint64_t offset, std::uint64_t length) {
    const DataFile& data = files_.at(place);
    const auto failure = [&](std::string what) {
        return Failure{data.path, std::move(what), tool::EP_ERR_READ_FAILED};
    };
    if (data.error != 0) return miss(length, {data.path, "", data.error, data.reason});
    std::uint64_t position = place.inFile * lun_.extentSize + offset;
    const std::uint64_t inVolume = place.inVolume * lun_.extentSize + offset;
    if (choice_.countFrom == CountFrom::volume) {
        position = inVolume;
    } else if (!choice_.countFrom && position != inVolume && inVolume < data.dataSize) {
        const std::uint64_t open = std::min(length, data.dataSize - inVolume);
        miss(open, {data.path,
                    "from where extents are counted is open, both places lie inside the file; --count-from chooses",
                    tool::EP_ERR_NO_PATH});
        position += open;
        length -= open;
    }
    const std::uint64_t there = position < data.dataSize ? std::min(length, data.dataSize - position) : 0;
    copy(data, position, there);
    miss(length - there,
         failure("beyond the end, the file holds " + std::to_string(data.dataSize) + " bytes of extents"));
}

/// `position` counts from the data start offset.
void LunReader::copy(const DataFile& data, std::uint64_t position, std::uint64_t length) {
    while (length > 0) {
        const auto piece =
            static_cast<std::uint32_t>(std::min<std::uint64_t>(length, pieceSize - position % pieceSize));
        copyPiece(data, position, piece);
        position += piece;
        length -= piece;
    }
}

/// A piece that lies inside one of the "extents" of pieceSize bytes in which the file is read, whatever its real ones.
void LunReader::copyPiece(const DataFile& data, std::uint64_t position, std::uint32_t length) {
    const auto offset = static_cast<std::uint32_t>(position % pieceSize);
    const int error = data.file->getExtentBytes(position / pieceSize, pieceSize, offset, length, bytes_);
    const int reason = errno;
    if (error == 0) return printBytes(bytes_, length);
    if (error != tool::EP_ERR_READ_FAILED || reason == 0 || length <= smallestPiece) {
        return miss(length, {data.path, "", error, reason});
    }
    const std::uint32_t half = (length / 2 + smallestPiece - 1) / smallestPiece * smallestPiece;
    copyPiece(data, position, half);
    copyPiece(data, position + half, length - half);
}

void LunReader::printZeros(std::uint64_t length) {
    while (length > 0) {
        const auto piece = static_cast<std::size_t>(std::min<std::uint64_t>(length, zeros_.size()));
        printBytes(zeros_.data(), piece);
        length -= piece;
    }
}

void LunReader::printBytes(const unsigned char* bytes, std::size_t length) {
    epinspect::print({reinterpret_cast<const char*>(bytes), length});
    at_ += length;
    progress_.show(at_ - first_);
}

void LunReader::miss(std::uint64_t length, const Failure& failure) {
    if (length == 0) return;
    const auto key = [](const Failure& f) { return std::tie(f.file, f.what, f.error, f.reason); };
    if (missingTo_ != at_ || key(failure_) != key(failure)) {
        reportMissing();
        failure_ = failure;
        missingFrom_ = at_;
    }
    missing_ += length;
    missingTo_ = at_ + length;
    printZeros(length);
}

void LunReader::reportMissing() {
    if (missingFrom_ == missingTo_) return;
    Subject subject = lun_.subject(bytesText(missingFrom_, missingTo_));
    if (!failure_.file.empty()) subject.file = failure_.file;
    if (failure_.what.empty()) {
        session_.succeeded(failure_.error, subject, failure_.reason);
    } else {
        session_.fail(subject, failure_.what, failure_.error);
    }
    missingFrom_ = missingTo_;
}

}  // namespace epinspect
