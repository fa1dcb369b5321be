// Programs that were linked before the small members of ISCSIEPMapEntryInfo became inline look for them in the library.
// This source is built without inlining, so that they stay in it.
#include <new>

#include "ISCSIEPMapEntryInfo.h"

namespace ISCSI::TOOL {

namespace {

[[gnu::used]] void useSmallMembers(void* memory) {
    new (memory) ISCSIEPMapEntryInfo;
    (new (memory) ISCSIEPMapEntryInfo(0, 0, false, false, false, false))->~ISCSIEPMapEntryInfo();
}

}  // namespace

}  // namespace ISCSI::TOOL
