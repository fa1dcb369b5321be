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

/// Walks `path`, which is taken as absolute, below `folder`. Each step is a call of the system by itself, so the way
/// may be of any length. As in the system, more than 40 links are too many (ELOOP). In `path` and in an absolute link,
/// `..` in the folder itself stays there; a relative link that climbs above the folder leads out.
PathEnd walkPath(const std::string& folder, const std::string& path, LastLink last);

}  // namespace inspection
