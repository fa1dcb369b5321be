#include "store/ChangeWatch.h"

#include <ISCSIEPFile.h>
#include <sys/stat.h>

#include <functional>
#include <string_view>
#include <tuple>
#include <utility>

namespace inspection {

namespace tool = ISCSI::TOOL;

ChangeWatch::ChangeWatch(Context& context, std::string name, std::string hostPath)
    : context_(&context), name_(std::move(name)), hostPath_(std::move(hostPath)), before_(look()) {}

bool ChangeWatch::noticeChange() const {
    const auto all = [](const State& state) {
        return std::tie(state.isThere, state.device, state.number, state.size, state.seconds, state.nanoseconds,
                        state.headerError, state.header);
    };
    const State now = look();
    if (all(now) == all(before_)) return false;
    context_->changed(name_);
    return true;
}

ChangeWatch::State ChangeWatch::look() const {
    State state;
    struct stat status = {};
    state.isThere = stat(hostPath_.c_str(), &status) == 0;
    if (!state.isThere) return state;
    state.device = status.st_dev;
    state.number = status.st_ino;
    state.size = status.st_size;
    state.seconds = status.st_mtim.tv_sec;
    state.nanoseconds = status.st_mtim.tv_nsec;
    if (!S_ISREG(status.st_mode) && !S_ISBLK(status.st_mode)) return state;
    const Trial trial(*context_);
    tool::ISCSIEPFile file(hostPath_);
    state.headerError = file.readHeader();
    if (state.headerError != 0) return state;
    const std::string_view block(reinterpret_cast<const char*>(file.headerBlock), sizeof file.headerBlock);
    state.header = std::hash<std::string_view>()(block);
    return state;
}

}  // namespace inspection
