// A store that holds a disk image.
#pragma once

#include <string>

namespace epsample {

/// Writes, below the existing empty folder `root`, a store whose LUN 1 holds the bytes of the file `image`, in extents
/// of 64 KiB scattered over three data files, filled up with zeros to a whole extent. Extents of zeros are not mapped,
/// but for some. Throws std::system_error when a file cannot be read or written.
void writeDiskStore(const std::string& root, const std::string& image);

}  // namespace epsample
