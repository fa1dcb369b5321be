#include "store/LunReader.h"

#include <algorithm>
#include <cerrno>
#include <tuple>
#include <utility>

#include "map/MapWalk.h"
#include "store/FileSize.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

constexpr std::uint32_t pieceSize = 1U << 20U;      ///< of a read
constexpr std::uint32_t smallestPiece = 1U << 12U;  ///< of a read in the neighbourhood of what cannot be read

/// How messages name the bytes from `begin` up to `end`, not including it.
std::string bytesText(std::uint64_t begin, std::uint64_t end) {
    const std::string first = std::to_string(begin);
    return end - begin == 1 ? "byte " + first : "bytes " + first + "-" + std::to_string(end - 1);
}

}  // namespace

LunReader::LunReader(Context& context, const LunMap& lun, const PlaceChoice& choice, std::uint64_t first,
                     std::uint64_t length, Write write)
    : context_(context),
      lun_(lun),
      choice_(choice),
      files_(context, lun.targetPath, true),
      write_(std::move(write)),
      buffer_(std::make_unique<Page[]>(pieceSize / sizeof(Page))),
      bytes_(buffer_[0].bytes),
      zeros_(pieceSize),
      first_(first),
      end_(first + length),
      at_(first) {}

std::uint64_t LunReader::run() {
    const std::uint64_t mapEnd = std::clamp(lun_.mappableSize(), first_, end_);
    // Said first: what follows may be long.
    if (mapEnd < end_) context_.failed(lun_.pastMap(bytesText(mapEnd, end_)));
    try {
        if (first_ < mapEnd) handMap(mapEnd);
        reportMissing();
        missing_ += end_ - mapEnd;
        handZeros(end_ - mapEnd);
    } catch (...) {
        reportMissing();
        throw;
    }
    return missing_;
}

/// The bytes up to `end`, not including it, for which the map had entries when it was opened.
void LunReader::handMap(std::uint64_t end) {
    MapRuns runs;
    const auto each = [this](const MapRun& run) { handRun(run); };
    const WalkEnd walk = walkMap(*lun_.map, {first_ / lun_.extentSize, (end - 1) / lun_.extentSize},
                                 [&](std::uint64_t index, const auto& entries) { runs.add(index, entries, each); });
    runs.finish(each);
    if (walk.error != 0) {
        miss(end - at_, {{lun_.file, ""}, walk.error, walk.reason, ""});
    } else {
        miss(end - at_,
             {{lun_.file, ""}, tool::EP_ERR_READ_FAILED, 0, "the file has become shorter while it was read"});
    }
}

void LunReader::handRun(const MapRun& run) {
    const std::uint64_t size = lun_.extentSize;
    const std::uint64_t end = std::min(end_, (run.first + run.count) * size);
    if (!run.entry.mapped) return handZeros(end - at_);
    const auto address = extentAddressOf(run.entry, choice_);
    if (!address) return miss(end - at_, {{}, tool::EP_ERR_NO_PATH, 0, ambiguousAddressText(run.entry)});
    while (at_ < end) {
        const auto place = placeOf(*address + (at_ / size - run.first), lun_.extentSize);
        if (!place) return miss(end - at_, {{}, tool::EP_ERR_SEEK_FAILED, 0, ""});
        const std::uint64_t offset = at_ % size;
        handExtents(*place, offset, std::min(end - at_, (place->next - place->inVolume) * size - offset));
    }
}

/// Of extents in one data file, `length` bytes from `offset` in the first one.
void LunReader::handExtents(const ExtentPlace& place, std::uint64_t offset, std::uint64_t length) {
    const DataFile& data = files_.at(place.dataFile);
    const auto failure = [&](std::string what) {
        return Failure{{data.path, ""}, tool::EP_ERR_READ_FAILED, 0, std::move(what)};
    };
    if (data.failure) return miss(length, *data.failure);
    std::uint64_t skipped = 0;
    auto counting = countingOf(place, lun_.extentSize, offset, data.dataSize, choice_);
    if (!counting) {  // up to where only one of the two places lies inside the file
        skipped = std::min(length, data.dataSize - (place.inVolume * lun_.extentSize + offset));
        miss(skipped, {{data.path, ""},
                       tool::EP_ERR_NO_PATH,
                       0,
                       "ambiguous: extents may be counted within the data file or from the volume's start, and both "
                       "places lie inside the file; --count-from decides"});
        counting = CountFrom::file;
    }
    const std::uint64_t position = place.counted(*counting) * lun_.extentSize + offset + skipped;
    length -= skipped;
    const std::uint64_t there = position < data.dataSize ? std::min(length, data.dataSize - position) : 0;
    const std::uint64_t held = position < data.held ? std::min(there, data.held - position) : 0;
    copy(data, position, held);
    miss(there - held, failure(notCollectedText));
    miss(length - there,
         failure("past the end, the file holds " + std::to_string(data.dataSize) + " bytes of extents"));
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
    if (error == 0) return handBytes(bytes_, length);
    if (error != tool::EP_ERR_READ_FAILED || reason == 0 || length <= smallestPiece) {
        return miss(length, {{data.path, ""}, error, reason, ""});
    }
    const std::uint32_t half = (length / 2 + smallestPiece - 1) / smallestPiece * smallestPiece;
    copyPiece(data, position, half);
    copyPiece(data, position + half, length - half);
}

void LunReader::handZeros(std::uint64_t length) {
    while (length > 0) {
        const auto piece = static_cast<std::size_t>(std::min<std::uint64_t>(length, zeros_.size()));
        handBytes(zeros_.data(), piece);
        length -= piece;
    }
}

void LunReader::handBytes(const unsigned char* bytes, std::size_t length) {
    write_(bytes, length);
    at_ += length;
    context_.progress("bytes", at_ - first_, end_ - first_);
}

void LunReader::miss(std::uint64_t length, const Failure& failure) {
    if (length == 0) return;
    const auto key = [](const Failure& f) { return std::tie(f.subject.file, f.what, f.error, f.reason); };
    if (missingTo_ != at_ || key(failure_) != key(failure)) {
        reportMissing();
        failure_ = failure;
        missingFrom_ = at_;
    }
    missing_ += length;
    missingTo_ = at_ + length;
    handZeros(length);
}

void LunReader::reportMissing() {
    if (missingFrom_ == missingTo_) return;
    Subject subject = lun_.subject(bytesText(missingFrom_, missingTo_));
    if (!failure_.subject.file.empty()) subject.file = failure_.subject.file;
    context_.failed({subject, failure_.error, failure_.reason, failure_.what});
    missingFrom_ = missingTo_;
}

}  // namespace inspection
