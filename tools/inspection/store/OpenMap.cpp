#include "store/OpenMap.h"

#include "store/Doubts.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

OpenedMap openMap(Context& context, const std::string& name, NamedBy by) {
    const std::optional<std::string> path = context.openablePath(name, by);
    if (!path) return {};
    const ChangeWatch watch(context, name, *path);
    auto file = std::make_unique<tool::ISCSIEPFileMAP>(*path);
    unsigned long long entries = 0;
    if (!context.succeeded(file->parseHead0(), {name, ""})) return {};
    if (!context.succeeded(file->getEntryCount(entries), {name, ""})) return {};
    remarkOnDataStart(context, *file, name);
    remarkOnPartialEntry(context, *file, name);
    return {std::move(file), entries, watch};
}

}  // namespace inspection
