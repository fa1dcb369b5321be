// What failed, as a value: for every program that looks at stores.
#pragma once

#include <string>

namespace inspection {

/// What a failure is about: a file as the user named it, and the place in it; or only something else, "LUN 9".
struct Subject {
    std::string file;
    std::string part;
};

struct Failure {
    Subject subject;
    int error = 0;     ///< an error code of the library or of the platform's library; 0 for what neither knows
    int reason = 0;    ///< the errno value, 0 where the system is not to blame
    std::string what;  ///< what failed; empty: what `error` says
};

/// "FILE: PART", as far as both are there.
std::string textOf(const Subject& subject);

/// "SUBJECT: what failed: the system's reason (EP_ERR_NAME, code)", the reason and the code where there are such.
std::string messageOf(const Failure& failure);

/// The failure to read `place` ("entry 4096") past the end of a file that holds `count` of such.
Failure pastEnd(const std::string& file, const std::string& place, unsigned long long count);

}  // namespace inspection
