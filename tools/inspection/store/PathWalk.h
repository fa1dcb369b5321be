// The way to a file, component by component, in a folder that stands for /.
#pragma once

#include <string>

#include "store/FileIdentity.h"

namespace inspection {

enum class LastLink { follow, keep };

/// Where a path leads, or how far it goes.
struct PathEnd {
    std::string path;       ///< absolute, without links and dots; what could not be walked stands at its end
    int error = 0;          ///< the errno value of the step that failed
    bool leadsOut = false;  ///< a relative link climbs above the folder; all that follows is then not set
    bool dangling = false;  ///< the step that failed was the way of a link
    std::string closed;     ///< the folder that was last walked into when a step was not permitted
    unsigned int mode = 0;  ///< st_mode of what lies there
    FileIdentity identity;
    std::string link;  ///< LastLink::keep: what is stored in the link that lies there
};

/// Walks `path`, which is taken as absolute, below `folder`. Each step is one of the system, so that the length of the
/// way does not matter; as in the system more than 40 links are too many (ELOOP). `..` in the folder itself stays
/// there, in `path` and in an absolute link; a relative link that climbs above it leads out.
PathEnd walkPath(const std::string& folder, const std::string& path, LastLink last);

}  // namespace inspection
