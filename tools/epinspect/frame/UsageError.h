// Wrong usage.
#pragma once

#include <string>

namespace epinspect {

/// `text` names the argument at fault. Thrown while an argument is parsed, it need not name it.
struct UsageError {
    std::string text;
};

}  // namespace epinspect
