#include "check/DataRules.h"

#include "store/FileNames.h"

namespace inspection {

void checkSerialNumber(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFileDAT& content, Report& report) {
    const auto number = dataFileNumberIn(file.path);
    if (!number)
        return report.notCompared(
            "serial-number: not the name of a data file of the target, which ends in a number of five digits or more",
            file.path);
    if (*number == content.serialNumber) return;
    report.add({file.path, Rule::serialNumber, Value::number(content.serialNumber), Value::number(*number)});
}

}  // namespace inspection
