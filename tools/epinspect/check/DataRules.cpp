#include "check/DataRules.h"

#include "check/VolumeData.h"

namespace epinspect {

void checkSerialNumber(const StoreFile& file, const ISCSI::TOOL::ISCSIEPFileDAT& content, Report& report) {
    const auto number = dataFileNumberIn(file.path);
    if (!number) return report.notCompared("serial-number: the file's name holds no number", file.path);
    if (*number == content.serialNumber) return;
    report.add({file.path, "serial-number", Value::number(content.serialNumber), Value::number(*number),
                std::to_string(content.serialNumber) + " stored, the name says " + std::to_string(*number)});
}

}  // namespace epinspect
