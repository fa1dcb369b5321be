// The walk through a map file, in constant memory.
#pragma once

#include <ISCSIEPFileMAP.h>

#include <algorithm>
#include <cstdint>
#include <vector>

#include "Progress.h"

namespace epinspect {

/// Calls visit(index, entry) for `count` entries from index `first` on, or as far as the file goes. Returns 0, or the
/// code of the first failed read; an entry `first` that is not there is a failed read.
template <typename Visit>
int walkMap(ISCSI::TOOL::ISCSIEPFileMAP& file, std::uint64_t first, std::uint64_t count, Visit&& visit) {
    constexpr std::uint64_t blockSize = 8192;
    Progress progress("entries");
    std::vector<ISCSI::TOOL::ISCSIEPMapEntryInfo> entries;
    std::uint64_t walked = 0;
    while (walked < count) {
        const std::uint64_t wanted = std::min(count - walked, blockSize);
        const int error = file.getMapEntries(first + walked, wanted, entries);
        if (error != 0) return error;
        if (walked == 0 && entries.empty()) return ISCSI::TOOL::EP_ERR_READ_FAILED;
        for (const auto& entry : entries) visit(first + walked++, entry);
        if (entries.size() < wanted) break;
        progress.show(walked);
    }
    return 0;
}

}  // namespace epinspect
