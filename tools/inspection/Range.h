// Numbers from one to another.
#pragma once

#include <cstdint>

namespace inspection {

/// Numbers from `first` to `last`, both included.
struct Range {
    std::uint64_t first;
    std::uint64_t last;
};

}  // namespace inspection
