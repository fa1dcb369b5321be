// Where the files of the target lie here: on the target itself as their paths say, of a copy below its folder.
#pragma once

#include <optional>
#include <string>
#include <system_error>

#include "Failure.h"
#include "store/FileIdentity.h"

namespace inspection {

/// What lies at a path, links followed.
struct Located {
    std::string hostPath;        ///< where to open it; below a root folder a path without links
    int error = 0;               ///< the errno value of the look at it
    bool leadsOut = false;       ///< a link leads out of the root folder
    bool dangling = false;       ///< `error` was met while a link was followed; set for paths of the target only
    std::string closed;          ///< the folder that may not be looked into; set for paths of the target only
    unsigned int mode = 0;       ///< st_mode, 0 after an error
    FileIdentity identity = {};  ///< set where there is no error

    bool isThere() const { return error == 0 && !leadsOut; }
    bool isMissing() const;
    bool isFolder() const;

    /// Why it must not be opened, or could not be looked at; `name` is what messages call it. Nothing when it may be,
    /// or when nothing is there. A file must be a regular one or a block device.
    std::optional<Failure> obstacle(const std::string& name) const;
    std::optional<Failure> obstacleToFile(const std::string& name) const;
};

class TargetRoot {
public:
    /// The machine itself.
    TargetRoot() = default;

    /// Makes `folder` stand for / of the target. Returns why it cannot; the root then stays as it was.
    std::error_code set(const std::string& folder);

    /// Whether a folder stands for /.
    bool isFolder() const { return identity_.has_value(); }

    /// Where the file that the user called `name` lies on the target, in plain form: what lies below the root folder,
    /// however that is spelt, or a path of the target.
    std::string targetPath(const std::string& name) const;

    /// `path` of the target in plain form: absolute, without doubled slashes and dots. Links stay, but for one before
    /// `..`, which is followed as the system does; where that is not possible the `..` stays too.
    std::string plainPath(const std::string& path) const { return plain(path, nullptr); }

    /// What lies at `path` of the target.
    Located locate(const std::string& path) const;

    /// What lies where the file is that the user called `name`.
    Located locateNamed(const std::string& name) const;

    /// What is stored in the link that lies at `path` of the target; nothing when that is no link.
    std::optional<std::string> linkAt(const std::string& path) const;

    /// Where `path` of the target is here, links not followed. Not to be opened: a link there may lead out.
    std::string hostPath(const std::string& path) const { return root_ + path; }

private:
    std::string plain(const std::string& path, bool* climbs) const;
    const std::string& folder() const;

    std::string root_;                      ///< as typed, without a slash at its end; empty: / itself
    std::optional<FileIdentity> identity_;  ///< of the root folder; nothing: the machine itself
};

}  // namespace inspection
