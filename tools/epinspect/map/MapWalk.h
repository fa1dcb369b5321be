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
        // A later block starts with the last entry of the one before, which is known to be there: so the end of the
        // file, where nothing more comes, is told from a failed read.
        const std::uint64_t seen = walked > 0 ? 1 : 0;
        const std::uint64_t wanted = std::min(count - walked, blockSize) + seen;
        const int error = file.getMapEntries(first + walked - seen, wanted, entries);
        if (error != 0) return error;
        for (auto i = static_cast<std::size_t>(seen); i < entries.size(); ++i) visit(first + walked++, entries[i]);
        if (entries.size() < wanted) break;
        progress.show(walked);
    }
    return 0;
}

}  // namespace epinspect
