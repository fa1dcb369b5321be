#include "store/PathWalk.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <climits>
#include <string_view>
#include <utility>
#include <vector>

#include "store/Descriptor.h"

namespace inspection {

namespace {

constexpr unsigned int mostLinks = 40;
constexpr int lookFlags = O_PATH | O_NOFOLLOW | O_CLOEXEC;  // neither reads nor waits, whatever lies there

class PathWalk {
public:
    PathWalk(const std::string& folder, LastLink last) : folder_(folder), last_(last) {}

    PathEnd walk(const std::string& path) {
        put(path, Origin::path);
        start();
        while (end_.error == 0 && !end_.leadsOut && !rest_.empty()) {
            const Step step = std::move(rest_.back());
            rest_.pop_back();
            take(step);
        }
        if (end_.path.empty()) end_.path = "/";
        return end_;
    }

private:
    enum class Origin { path, absoluteLink, relativeLink };

    struct Step {
        std::string name;
        Origin origin;
    };

    /// Puts the components of `path` before what is left to be walked.
    void put(std::string_view path, Origin origin) {
        std::vector<Step> steps;
        while (!path.empty()) {
            const auto end = std::min(path.find('/'), path.size());
            if (end > 0) steps.push_back({std::string(path.substr(0, end)), origin});
            if (end + 1 == path.size()) steps.push_back({".", origin});  // only a folder has a slash at its end
            path.remove_prefix(std::min(path.size(), end + 1));
        }
        rest_.insert(rest_.end(), steps.rbegin(), steps.rend());
    }

    void start() {
        end_.path.clear();
        enter(Descriptor(open(folder_.c_str(), O_PATH | O_DIRECTORY | O_CLOEXEC)));
    }

    void enter(Descriptor folder) {
        struct stat status = {};
        if (!folder.isOpen() || fstat(folder.number(), &status) != 0) {
            end_.error = errno;
        } else {
            reach(status);
            current_ = std::move(folder);
        }
    }

    void reach(const struct stat& status) {
        end_.mode = status.st_mode;
        end_.identity = {status.st_dev, status.st_ino};
    }

    void take(const Step& step) {
        if (!S_ISDIR(end_.mode)) return stop(step, ENOTDIR);
        if (step.name == ".") return;
        if (step.name == "..") return climb(step);
        Descriptor there(openat(current_.number(), step.name.c_str(), lookFlags));
        struct stat status = {};
        if (!there.isOpen() || fstat(there.number(), &status) != 0) return stop(step, errno);
        if (S_ISLNK(status.st_mode)) return takeLink(step, status);
        end_.path += "/" + step.name;
        reach(status);
        if (S_ISDIR(status.st_mode)) current_ = std::move(there);
    }

    void climb(const Step& step) {
        if (end_.path.empty()) {
            end_.leadsOut = step.origin == Origin::relativeLink && !isTop();
            return;
        }
        Descriptor above(openat(current_.number(), "..", O_DIRECTORY | lookFlags));
        if (!above.isOpen()) return stop(step, errno);
        end_.path.erase(end_.path.rfind('/'));
        if (end_.path.empty()) return start();
        enter(std::move(above));
    }

    void takeLink(const Step& step, const struct stat& status) {
        char text[PATH_MAX];
        const ssize_t length = readlinkat(current_.number(), step.name.c_str(), text, sizeof text);
        if (length < 0) return stop(step, errno);
        const std::string link(text, static_cast<std::size_t>(length));
        if (link.empty()) return stop(step, ENOENT);
        if (rest_.empty() && last_ == LastLink::keep) {
            end_.path += "/" + step.name;
            end_.link = link;
            return reach(status);
        }
        if (++links_ > mostLinks) return stop(step, ELOOP);
        put(link, link[0] == '/' ? Origin::absoluteLink : Origin::relativeLink);
        if (link[0] == '/') start();
    }

    void stop(const Step& step, int error) {
        end_.error = error;
        end_.dangling = step.origin != Origin::path;
        if (error == EACCES) end_.closed = end_.path.empty() ? "/" : end_.path;
        end_.path += "/" + step.name;
        for (auto left = rest_.rbegin(); left != rest_.rend(); ++left) end_.path += "/" + left->name;
    }

    bool isTop() const { return identityOf(folder_) == identityOf("/"); }

    const std::string& folder_;
    const LastLink last_;
    std::vector<Step> rest_;  ///< the next one is the last
    Descriptor current_;
    unsigned int links_ = 0;
    PathEnd end_;
};

}  // namespace

PathEnd walkPath(const std::string& folder, const std::string& path, LastLink last) {
    return PathWalk(folder, last).walk(path);
}

}  // namespace inspection
