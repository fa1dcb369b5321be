// Copies the bytes of a LUN to where they are wanted.
#pragma once

#include <cstdint>
#include <optional>
#include <string_view>

#include "frame/Session.h"
#include "store/LunBytes.h"

namespace epinspect {

/// Where the bytes of a LUN go, one after the other. May throw.
class LunSink {
public:
    LunSink() = default;
    LunSink(const LunSink&) = delete;
    LunSink& operator=(const LunSink&) = delete;
    virtual ~LunSink() = default;

    virtual void put(std::string_view bytes) = 0;

    /// `length` bytes are not mapped, or cannot be read. Returns how many of them it took: at least one.
    virtual std::uint64_t skip(std::uint64_t length) = 0;
};

/// How many bytes there were of each kind.
struct LunTotals {
    std::uint64_t data = 0, holes = 0, missing = 0;

    std::uint64_t all() const { return data + holes + missing; }
};

/// Copies bytes of a LUN and reports those that cannot be read, as `missing` objects too with --json.
class LunCopy {
public:
    LunCopy(Session& session, const LunMap& lun, const PlaceChoice& choice, LunSink& sink);

    /// Copies `length` bytes from `offset` on, all of them inside the LUN. Throws what the sink throws, and
    /// Interrupted; what is known to be missing by then has been reported.
    void run(std::uint64_t offset, std::uint64_t length);

    /// What has been copied so far.
    const LunTotals& totals() const { return totals_; }

private:
    void copyData(const LunPart& part);
    void miss(const LunPart& part);
    void skip(std::uint64_t length, std::uint64_t& total);
    void reportMissing();
    void advance();

    Session& session_;
    const LunMap& lun_;
    LunSink& sink_;
    LunBytes bytes_;
    LunTotals totals_;
    std::uint64_t length_ = 0;        ///< of all that is wanted
    std::optional<LunPart> missing_;  ///< not reported yet: more of it may come
};

}  // namespace epinspect
