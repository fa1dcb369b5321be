#include "check/Report.h"

namespace inspection {

void Report::notCompared(const std::string& what, const std::string& file) {
    Files& files = notCompared_[what];
    if (files.count++ == 0) files.first = file;
}

std::vector<std::string> Report::gaps() const {
    std::vector<std::string> texts;
    for (const auto& [what, files] : notCompared_) {
        const std::string file = files.first.empty() ? "" : ": " + files.first;
        texts.push_back(what + file + (files.count > 1 ? " and " + std::to_string(files.count - 1) + " more" : ""));
    }
    return texts;
}

}  // namespace inspection
