#include "ISCSIEPMapEntryInfo.h"

#include "LineText.h"

namespace ISCSI::TOOL {

std::string ISCSIEPMapEntryInfo::toString() const {
    return LineText()
               .dec("pool number", poolNumber)
               .dec("extent address", extentAddress)
               .truth("mapped", mapped)
               .truth("vpushed", vpushed)
               .truth("vpulled", vpulled)
               .truth("synced", synced)
               .str() +
           '\n';
}

}  // namespace ISCSI::TOOL
