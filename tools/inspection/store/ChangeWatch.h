// Whether a file changes while it is read: nothing is locked, and a store may be in use.
#pragma once

#include <sys/types.h>

#include <cstdint>
#include <string>

#include "store/Context.h"

namespace inspection {

class ChangeWatch {
public:
    /// Watches the file at `hostPath`, which the user called `name`. To be made before the file is first read.
    ChangeWatch(Context& context, std::string name, std::string hostPath);

    /// Whether the file has been replaced, or its size, modification time or header block has changed; the context is
    /// then informed. Changes errno.
    bool noticeChange() const;

private:
    struct State {
        bool isThere = false;
        dev_t device = 0;
        ino_t number = 0;
        std::int64_t size = 0, seconds = 0, nanoseconds = 0;
        int headerError = 0;     ///< of reading the header block
        std::size_t header = 0;  ///< hash of its bytes
    };

    State look() const;

    Context* context_;
    std::string name_;
    std::string hostPath_;
    State before_;
};

}  // namespace inspection
