// A read-only stream on one EP file.
#pragma once

#include <cstdint>
#include <fstream>
#include <string>

namespace ISCSI::TOOL {

/// Keeps no buffer: an open, a seek and a read are one request to the system each, and the bytes go straight to the
/// caller. Closed by its destructor. Throws nothing.
class EPFileStream {
public:
    explicit EPFileStream(const std::string& path) noexcept;

    bool isOpen() const { return file_.is_open(); }

    /// Goes to `position`, taken as a signed 64-bit offset from the start of the file.
    bool seek(std::uint64_t position) noexcept;

    /// Reads up to `size` bytes. Returns how many came, fewer than `size` only at the end of the file; -1 on an error.
    std::streamsize readUpTo(unsigned char* bytes, std::streamsize size) noexcept;

    /// Reads `size` bytes; false when fewer came.
    bool read(unsigned char* bytes, std::streamsize size) noexcept { return readUpTo(bytes, size) == size; }

private:
    std::filebuf file_;
};

}  // namespace ISCSI::TOOL
