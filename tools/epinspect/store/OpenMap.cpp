#include "store/OpenMap.h"

#include "store/Doubts.h"

namespace epinspect {

namespace tool = ISCSI::TOOL;

OpenedMap openMap(Session& session, const std::string& name) {
    const std::optional<std::string> path = session.openablePath(name);
    if (!path) return {};
    auto file = std::make_unique<tool::ISCSIEPFileMAP>(*path);
    unsigned long long entries = 0;
    if (!session.succeeded(file->parseHead0(), {name, ""})) return {};
    if (!session.succeeded(file->getEntryCount(entries), {name, ""})) return {};
    sayDataStartDoubts(*file, name);
    sayPartialEntry(*file, name);
    return {std::move(file), entries};
}

}  // namespace epinspect
