// Where the files of the target lie here: on the target itself as their paths say, of a copy below its folder.
#pragma once

#include <optional>
#include <string>
#include <system_error>

namespace inspection {

class TargetRoot {
public:
    /// The machine itself.
    TargetRoot() = default;

    /// Makes `folder` stand for / of the target. Returns why it cannot; the root then stays as it was.
    std::error_code set(const std::string& folder);

    /// Whether a folder stands for /.
    bool isFolder() const { return !canonical_.empty(); }

    /// Where the file that the user called `name` lies on the target, as an absolute path: what lies below the root
    /// folder, however that is spelt, or a path of the target.
    std::string targetPath(const std::string& name) const;

    /// Where what lies at `path` of the target is here. Whether it may be opened is another question.
    std::string hostPath(const std::string& path) const { return root_ + path; }

    /// Whether something lies at `path` of the target.
    bool exists(const std::string& path) const;

    /// Why what lies at `hostPath` must not be opened: it is neither a regular file nor a block device, or a link leads
    /// out of the root folder. Null when it may be, or when nothing is there.
    const char* refusalOfFile(const std::string& hostPath) const;

    /// The same of a folder, which only a link makes one that must not be opened.
    const char* refusalOfFolder(const std::string& hostPath) const;

private:
    bool leadsOut(const std::string& hostPath) const;

    std::string root_;       ///< as typed, without a slash at its end; empty: / itself
    std::string canonical_;  ///< without links; empty: the machine itself
};

}  // namespace inspection
