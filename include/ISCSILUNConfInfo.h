// The configuration of one LUN, as the platform's iSCSI service keeps it.
#pragma once

#include <string>

#include "etc/ISCSIEPDiagnostics.h"

namespace ISCSI::TOOL {

/// A LUN's configuration record: a plain value, used by one thread at a time.
class ISCSI_EP_EXPORT ISCSILUNConfInfo {
public:
    ISCSILUNConfInfo();
    explicit ISCSILUNConfInfo(unsigned int lunId);
    ISCSILUNConfInfo(const ISCSILUNConfInfo&) = default;
    ISCSILUNConfInfo& operator=(const ISCSILUNConfInfo&) = default;
    virtual ~ISCSILUNConfInfo();

    /// Fills every field but `lid` from the platform's configuration of the LUN `lid`; may be called again.
    /// Returns 0, or the platform library's own code, logged with that library's text; every field then stays as it
    /// was. Throws nothing but std::bad_alloc, with every field as it was.
    int loadFromConfig();

    /// The platform library's text for one of its codes; empty where it has none. Keeps errno. Throws nothing but
    /// std::bad_alloc.
    static std::string getErrorText(int error);

    /// The name of the LUN type `type` ("BLUN"), as toString() shows it and the map file's name starts with it;
    /// "UNKNOWN" for a type code without a name. Throws nothing but std::bad_alloc.
    std::string getTypeName() const;

    /// The record as one line without a line end. Throws nothing but std::bad_alloc.
    std::string toString() const;

    unsigned int lid = 0;
    unsigned int extentSize = 0;   ///< bytes
    unsigned long long size = 0;   ///< bytes
    unsigned int restoreTime = 0;  ///< seconds since 1970-01-01 00:00:00 UTC, shown as signed
    int type = 0;                  ///< LUN type code
    std::string uuid;
    std::string rootPath;
    std::string name;
};

}  // namespace ISCSI::TOOL
