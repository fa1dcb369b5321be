// What failed, as a value: for every program that looks at stores.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

namespace inspection {

/// What a failure is about: a file as the user named it, and the place in it; or a LUN, "LUN 9 byte 5".
struct Subject {
    std::string file;
    std::string part;
    std::optional<std::uint32_t> lid = {};  ///< of the LUN that `part` names
    std::string map = {};                   ///< its map file, where `file` is empty and the map is known
};

struct Failure {
    Subject subject;
    int error = 0;     ///< an error code of the library or of the platform's library; 0 for what neither knows
    int reason = 0;    ///< the errno value, 0 where the system is not to blame
    std::string what;  ///< what failed; empty: what `error` says
    std::vector<std::string> log = {};  ///< the library's log lines about it, where they were held back
};

/// "FILE: PART", or the one of the two that is there.
std::string textOf(const Subject& subject);

/// "what failed: the system's reason (EP_ERR_NAME, code)", the reason and the code where there are such.
std::string whatOf(const Failure& failure);

/// The same after "SUBJECT: ".
std::string messageOf(const Failure& failure);

/// The failure to read `place` ("entry 4096") past the end of a file that holds `count` of them.
Failure pastEnd(const std::string& file, const std::string& place, unsigned long long count);

}  // namespace inspection
