// A LUN store with one fault of each kind, to see what a check finds; the same at each run.
#pragma once

#include <string>

namespace epsample {

/// Writes the store below the empty folder `root`: each fault alone in its file, everything else as it should be.
/// Throws std::system_error.
void writeBrokenStore(const std::string& root);

}  // namespace epsample
