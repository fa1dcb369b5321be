#include "commands/LunCopy.h"

#include <algorithm>
#include <memory>
#include <utility>

#include "frame/Interruption.h"
#include "frame/Json.h"

namespace epinspect {

namespace {

constexpr std::uint64_t pieceSize = 2U << 20U;  ///< of a read

/// The system copies fastest to where a page starts.
struct alignas(4096) Page {
    unsigned char bytes[4096];
};

}  // namespace

LunCopy::LunCopy(Session& session, const LunMap& lun, const PlaceChoice& choice, LunSink& sink)
    : session_(session), lun_(lun), sink_(sink), bytes_(session, lun, choice) {}

void LunCopy::run(std::uint64_t offset, std::uint64_t length) {
    length_ = length;
    holdInterruptions();
    try {
        bytes_.forEachPart(offset, length, [this](const LunPart& part) {
            if (part.kind == LunPart::Kind::data) {
                copyData(part);
            } else if (part.kind == LunPart::Kind::unreadable) {
                miss(part);
            } else {
                skip(part.length, totals_.holes);
            }
            return true;
        });
    } catch (...) {
        reportMissing();
        throw;
    }
    reportMissing();
    bytes_.noticeChanges();
}

void LunCopy::copyData(const LunPart& part) {
    static const auto buffer = std::make_unique<Page[]>(pieceSize / sizeof(Page));
    unsigned char* const bytes = buffer[0].bytes;
    for (std::uint64_t done = 0; done < part.length;) {
        const LunPart piece = part.dataIn(done, std::min(pieceSize, part.length - done));
        std::uint64_t put = 0;
        const auto putUpTo = [&](std::uint64_t end) {
            sink_.put({reinterpret_cast<const char*>(bytes) + put, static_cast<std::size_t>(end - put)});
            totals_.data += end - put;
        };
        bytes_.readData(piece, bytes, [&](const LunPart& lost) {
            putUpTo(lost.offset - piece.offset);
            put = lost.end() - piece.offset;
            miss(lost);
            return true;
        });
        putUpTo(piece.length);
        done += piece.length;
        advance();
    }
}

void LunCopy::miss(const LunPart& part) {
    if (missing_ && missing_->continuesWith(part)) {
        missing_->length += part.length;
    } else {
        reportMissing();
        missing_ = part;
    }
    skip(part.length, totals_.missing);
}

void LunCopy::skip(std::uint64_t length, std::uint64_t& total) {
    while (length > 0) {
        const std::uint64_t taken = sink_.skip(length);
        total += taken;
        length -= taken;
        advance();
    }
}

void LunCopy::reportMissing() {
    if (!missing_) return;
    const LunPart part = *std::exchange(missing_, std::nullopt);
    const Failure failure = bytes_.failureOf(part);
    session_.complainOf(failure);
    if (!session_.json) return;
    Json object(lun_.file, lun_.lids);
    object.begin("missing")
        .number("lunOffset", part.offset)
        .number("length", part.length)
        .text("message", messageOf(failure))
        .end();
}

void LunCopy::advance() {
    session_.progress("bytes", totals_.all(), length_);
    checkInterruption();
}

}  // namespace epinspect
