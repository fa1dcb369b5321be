#include "store/Descriptor.h"

#include <unistd.h>

#include <cerrno>

namespace inspection {

int Descriptor::close() noexcept {
    const int number = std::exchange(number_, -1);
    return number >= 0 && ::close(number) != 0 ? errno : 0;
}

}  // namespace inspection
