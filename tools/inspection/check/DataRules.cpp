#include "check/DataRules.h"

#include "store/FileNames.h"

namespace inspection {

void checkSerialNumber(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFileDAT& content, Report& report) {
    if (isMisnamed(file.path)) {
        return report.notCompared("serial-number: not a name that the target gives to a data file", file.path);
    }
    const auto number = dataFileNumberIn(file.path);
    if (!number) return report.notCompared("serial-number: the file's name holds no number", file.path);
    if (*number == content.serialNumber) return;
    report.add({file.path, Rule::serialNumber, Value::number(content.serialNumber), Value::number(*number)});
}

}  // namespace inspection
