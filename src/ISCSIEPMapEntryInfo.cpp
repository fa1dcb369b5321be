#include "ISCSIEPMapEntryInfo.h"

#include "DumpText.h"

namespace ISCSI::TOOL {

ISCSIEPMapEntryInfo::ISCSIEPMapEntryInfo() = default;

ISCSIEPMapEntryInfo::ISCSIEPMapEntryInfo(unsigned long long entryExtentAddress, unsigned int entryPoolNumber,
                                         bool isMapped, bool isVPushed, bool isVPulled, bool isSynced)
    : extentAddress(entryExtentAddress),
      poolNumber(entryPoolNumber),
      mapped(isMapped),
      vpushed(isVPushed),
      vpulled(isVPulled),
      synced(isSynced) {}

ISCSIEPMapEntryInfo::~ISCSIEPMapEntryInfo() = default;

std::string ISCSIEPMapEntryInfo::toString() const {
    const auto truth = [](bool flag) { return flag ? "true" : "false"; };
    std::string text = "pool number: ";
    appendNumber(text, poolNumber);
    appendNumber(text.append(" ,extent address: "), extentAddress);
    text.append(" ,mapped: ").append(truth(mapped));
    text.append(" ,vpushed: ").append(truth(vpushed));
    text.append(" ,vpulled: ").append(truth(vpulled));
    text.append(" ,synced: ").append(truth(synced));
    text.push_back('\n');
    return text;
}

}  // namespace ISCSI::TOOL
