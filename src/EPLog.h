// The log line for code that several operations share: it names the operation on whose behalf it writes.
#pragma once

#include "etc/ISCSIEPDiagnostics.h"

/// As EP_LOG_ERR, with the source file and the operation given.
#define EP_LOG_ERR_FOR(sourceFile, operation, line, format, ...) \
    ::syslog(LOG_ERR, "iSCSI:%s:%d:%s " format, sourceFile, line, operation, __VA_ARGS__)
