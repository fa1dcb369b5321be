// A LUN whose bytes are looked for: its map file, and how much there is.
#pragma once

#include <ISCSIEPFileMAP.h>

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

#include "store/ChangeWatch.h"
#include "store/Context.h"
#include "store/NamedMap.h"

namespace inspection {

struct LunMap {
    std::vector<std::uint32_t> lids;  ///< of the LUNs whose map it is, as far as they are known
    std::string file;                 ///< the map file as the user typed it, or as the configuration names it
    std::string targetPath;           ///< the same on the target
    std::unique_ptr<ISCSI::TOOL::ISCSIEPFileMAP> map;  ///< its HEAD[0] is decoded
    std::uint32_t extentSize = 0;                      ///< never 0
    std::optional<ChangeWatch> watch;                  ///< of the map file, from before it was opened
    std::uint64_t entries = 0;
    std::uint64_t size = 0;  ///< bytes of the LUN, at most 2^63: as configured, else what the entries hold

    /// How many bytes the entries stand for, at most 2^63.
    std::uint64_t mappableSize() const;

    /// The same LUN, for another thread.
    LunMap copy() const;

    /// How messages name a part of the LUN, "byte 5": with the first id where one is known, else with the file.
    Subject subject(const std::string& part) const;

    /// The failures to find `part` past the end of the LUN, and past the last entry of the map.
    Failure pastEnd(const std::string& part) const;
    Failure pastMap(const std::string& part) const;
};

/// Opens the map of a LUN. The extent size is that of the configuration unless one is given, which it must be for a map
/// whose LUN is not known. Reports what fails.
std::optional<LunMap> openLunMap(Context& context, const LunName& lun, std::optional<std::uint32_t> extentSize);

}  // namespace inspection
