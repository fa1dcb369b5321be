// What holds for a whole run of epinspect: the options every subcommand takes, and how it went so far.
#pragma once

#include <optional>
#include <string>

namespace epinspect {

class Session {
public:
    /// Makes `folder` stand for / of the target: files are opened below it, and the LUN list is looked for there.
    void setRoot(std::string folder);

    bool failed = false;  ///< something could not be read or found

    /// Where the file that the user called `name` lies on the target: a name below the root folder, or a path of the
    /// target.
    std::string targetPath(const std::string& name) const;

    /// Where to open that file here, unless something lies there that is neither a regular file nor a block device:
    /// then complains, marks the session as failed and returns nothing. What is missing is left to the library to
    /// report.
    std::optional<std::string> openablePath(const std::string& name);

    /// Complains about `subject` and marks the session as failed when `error` is not 0; tells whether it is 0.
    bool succeeded(int error, const std::string& subject);

private:
    std::string root_;  ///< without a slash at its end; empty: / itself
};

/// From now on the library's log lines are shown on standard error too.
void showLogLines();

}  // namespace epinspect
