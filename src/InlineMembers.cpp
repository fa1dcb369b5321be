// The library exports every operation of its classes. Callers built from the headers have the constructors of
// ISCSIEPMapEntryInfo inline; for those that look them up in the library (another language, dlsym()), this source is
// compiled without inlining, so that they become functions here.
#include <new>

#include "ISCSIEPMapEntryInfo.h"

namespace ISCSI::TOOL {

namespace {

[[gnu::used]] void useInlineMembers(void* memory) {
    new (memory) ISCSIEPMapEntryInfo;
    new (memory) ISCSIEPMapEntryInfo(0, 0, false, false, false, false);
}

}  // namespace

}  // namespace ISCSI::TOOL
