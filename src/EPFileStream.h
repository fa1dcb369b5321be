// A read-only stream on one EP file: the only place that opens, seeks and reads.
#pragma once

#include <cstddef>
#include <cstdint>
#include <optional>
#include <string>

namespace ISCSI::TOOL {

/// The system's own calls, without a buffer: an open, a seek and a read are one request each, and the bytes go straight
/// to the caller. What fails leaves the system's reason in errno, 0 when the file has merely ended. Closed by its
/// destructor, which keeps errno. Throws nothing.
class EPFileStream {
public:
    explicit EPFileStream(const std::string& path) noexcept;
    EPFileStream(const EPFileStream&) = delete;
    EPFileStream& operator=(const EPFileStream&) = delete;
    ~EPFileStream();

    bool isOpen() const noexcept;

    /// Goes to `position`, taken as a signed 64-bit offset from the start of the file.
    bool seek(std::uint64_t position) noexcept;

    /// Goes to the end of the file or device and tells its position; nothing on an error.
    std::optional<std::uint64_t> seekToEnd() noexcept;

    /// Reads up to `size` bytes and tells how many came: fewer only at the end of the file. Nothing on an error.
    std::optional<std::size_t> readUpTo(unsigned char* bytes, std::size_t size) noexcept;

    /// Reads `size` bytes; false when fewer came.
    bool read(unsigned char* bytes, std::size_t size) noexcept;

private:
    int descriptor_;
    int openError_;  ///< errno of the open that failed
};

}  // namespace ISCSI::TOOL
