#include "store/Context.h"

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <utility>

#include "store/FileNames.h"
#include "store/FileSize.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

constexpr const char* listVariable = "KELPISCSIEP_LUNS";  // of the stand-in for the platform's library

/// The list that was set for a store: what another store has set is no choice of the user's.
std::string& listOfStore() {
    static std::string path;
    return path;
}

}  // namespace

std::error_code Context::setRoot(const std::string& folder) {
    const std::error_code error = root.set(folder);
    if (error) return error;
    const Located list = root.locate(std::string("/") + Collection::listName);
    damagedCollection = list.obstacleToFile(pathIn(folder, Collection::listName));
    if (!list.isThere() || damagedCollection) return {};
    auto found = Collection::read(folder, list.hostPath);
    if (auto* made = std::get_if<Collection>(&found)) collection = std::move(*made);
    if (auto* failure = std::get_if<Failure>(&found)) damagedCollection = std::move(*failure);
    return {};
}

std::optional<std::uint64_t> Context::sizeOf(const std::string& hostPath) const {
    const auto size = collection ? collection->sizeOf(hostPath) : std::nullopt;
    return size ? size : inspection::sizeOf(hostPath);
}

bool Context::succeeded(int error, const Subject& subject) {
    if (error != 0) failed({subject, error, errno, {}});
    return error == 0;
}

void Context::fail(const Subject& subject, std::string_view what, int error) {
    failed({subject, error, 0, std::string(what)});
}

bool Context::hasChanged(const std::string& name) const {
    return std::find(changedFiles_.begin(), changedFiles_.end(), name) != changedFiles_.end();
}

void Context::changed(const std::string& name) {
    if (hasChanged(name)) return;
    changedFiles_.push_back(name);
    remark(name, "has changed while it was read");
}

std::optional<std::string> Context::openablePath(const std::string& name, NamedBy by) {
    Located located = by == NamedBy::user ? root.locateNamed(name) : root.locate(name);
    auto obstacle = located.obstacleToFile(name);
    if (by == NamedBy::user && located.isFolder()) obstacle->what += "; --root takes the folder of a store";
    const bool left = !root.isFolder() && located.error != 0;  // the library meets the same failure, and logs it
    if (!obstacle || left) return std::move(located.hostPath);
    failed(*obstacle);
    return std::nullopt;
}

bool Context::isListNamed() {
    const char* set = std::getenv(listVariable);
    return set != nullptr && set != listOfStore();
}

void Context::prepareLuns() {
    if (!root.isFolder() || isListNamed()) return;
    if (!lunList_) {
        Located list = root.locate(lunListPath);
        const auto obstacle = list.obstacle(lunListPath);
        if (obstacle && list.error != EACCES) {  // the stand-in meets that too, and before any link
            failed(*obstacle);
            list.hostPath = "/dev/null";
        } else if (list.isMissing() && list.dangling) {  // one that is not there at all is no failure
            failed({{lunListPath, ""}, tool::EP_ERR_OPEN_FAILED, list.error, {}});
        }
        lunList_ = std::move(list.hostPath);
    }
    if (listOfStore() == *lunList_ && std::getenv(listVariable) != nullptr) return;
    setenv(listVariable, lunList_->c_str(), 1);
    listOfStore() = *lunList_;
}

}  // namespace inspection
