#include "store/Context.h"

#include <etc/ISCSIEPDiagnostics.h>

#include <algorithm>
#include <cerrno>
#include <cstdlib>
#include <utility>

#include "store/FileSize.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

std::error_code Context::setRoot(const std::string& folder) {
    const std::error_code error = root.set(folder);
    if (error) return error;
    auto found = Collection::read(folder);
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

std::optional<std::string> Context::openablePath(const std::string& name) {
    std::string path = root.isFolder() ? root.hostPath(root.targetPath(name)) : name;
    const char* refusal = root.refusalOfFile(path);
    if (refusal == nullptr) return path;
    fail({name, ""}, std::string("cannot be opened: ") + refusal, tool::EP_ERR_OPEN_FAILED);
    return std::nullopt;
}

std::optional<std::string> Context::openableFolder(const std::string& path) {
    std::string folder = root.hostPath(path);
    const char* refusal = root.refusalOfFolder(folder);
    if (refusal == nullptr) return folder;
    fail({path, ""}, std::string("cannot be opened: ") + refusal, tool::EP_ERR_OPEN_FAILED);
    return std::nullopt;
}

void Context::prepareLuns() {
    if (!root.isFolder() || std::exchange(lunsPrepared_, true)) return;
    std::string list = root.hostPath("/var/db/iscsi/luns.json");
    if (const char* refusal = root.refusalOfFolder(list)) {
        remark(list, std::string("not used: ") + refusal);
        list = "/dev/null";
    }
    // The stand-in for the platform's library reads that list; another choice in the environment wins.
    setenv("KELPISCSIEP_LUNS", list.c_str(), 0);
}

}  // namespace inspection
