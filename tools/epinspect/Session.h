// What holds for a whole run of epinspect: the options every subcommand takes, where files are, and how it went so far.
#pragma once

#include <optional>
#include <string>
#include <string_view>

#include "SystemLog.h"

namespace epinspect {

/// What a failure is about: a file as the user typed it, and the place in it; or only something else, "LUN 9".
struct Subject {
    std::string file;
    std::string part;
};

class Session {
public:
    bool json = false;         ///< --json: failures are objects on standard output too
    bool differences = false;  ///< all was read, and there are findings or differences

    /// Makes `folder` stand for / of the target: files are opened below it, and nothing goes to the system log. Throws
    /// UsageError when it is no folder.
    void setRoot(const std::string& folder);

    /// To be called before the first look at a LUN: its list is then looked for below the root folder too.
    void prepareLuns();

    /// Where the file that the user called `name` lies on the target, as an absolute path: what lies below the root
    /// folder, however that is spelt, or a path of the target.
    std::string targetPath(const std::string& name) const;

    /// Whether something lies at `path` of the target.
    bool exists(const std::string& path) const;

    /// Where to open the file that the user called `name`, unless something lies there that may not be opened: neither
    /// a regular file nor a block device, or a link that leads out of the root folder. Then reports that failure and
    /// returns nothing. What is missing is left to the library to find.
    std::optional<std::string> openablePath(const std::string& name);

    /// The same for a folder at `path` of the target. Whether it can be listed is left to find.
    std::optional<std::string> openableFolder(const std::string& path);

    /// Reports the failure of a call of the library, right after it (the system's reason is still in errno), when
    /// `error` is not 0. Returns whether it is 0.
    bool succeeded(int error, const Subject& subject);

    /// The same later; `reason` is what the call left in errno.
    bool succeeded(int error, const Subject& subject, int reason);

    /// Reports a failure of this program's own making, under the library's code that fits.
    void fail(const Subject& subject, std::string_view what, int error);

    /// Reports that `place` ("entry 4096") is behind the end of a file that holds `count` of such.
    void failBeyondEnd(const std::string& file, const std::string& place, unsigned long long count);

    /// The exit status that the run so far amounts to.
    int status() const;

private:
    /// Where what lies at `path` of the target is here.
    std::string hostPath(const std::string& path) const { return root_ + path; }

    /// Whether `path`, as it is here, leads out of the root folder.
    bool leadsOut(const std::string& path) const;

    bool failed_ = false;
    bool lunsPrepared_ = false;
    std::string root_;           ///< as typed, without a slash at its end; empty: / itself
    std::string canonicalRoot_;  ///< without links; empty without --root
    std::optional<QuietLog> quiet_;
};

}  // namespace epinspect
