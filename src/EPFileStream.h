// A read-only stream on one EP file: the only place that opens, seeks and reads.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

namespace ISCSI::TOOL {

/// The system's own calls, without a buffer: an open, a seek and a read are one call each, and the bytes go straight to
/// the caller. What fails leaves the system's reason in errno, 0 when the file has merely ended. The destructor closes
/// the file and keeps errno. Throws nothing.
class EPFileStream {
public:
    EPFileStream() = default;
    EPFileStream(const EPFileStream&) = delete;
    EPFileStream& operator=(const EPFileStream&) = delete;
    ~EPFileStream();

    /// Opens the file at `path`; called once.
    bool open(const std::string& path) noexcept;

    /// Goes to `position`, taken as a signed 64-bit offset from the start of the file.
    bool seek(std::uint64_t position) noexcept;

    /// Goes to the end of the file or device and returns its position; nothing on an error.
    std::optional<std::uint64_t> seekToEnd() noexcept;

    /// Reads up to `size` bytes and returns how many came: fewer only at the end of the file. Nothing on an error.
    std::optional<std::size_t> readUpTo(unsigned char* bytes, std::size_t size) noexcept;

    /// Reads `size` bytes; false when fewer came.
    bool read(unsigned char* bytes, std::size_t size) noexcept;

private:
    int descriptor_ = -1;
};

}  // namespace ISCSI::TOOL
