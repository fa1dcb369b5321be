#include "EPFileStream.h"

#include <exception>

namespace ISCSI::TOOL {

EPFileStream::EPFileStream(const std::string& path) noexcept {
    try {
        file_.pubsetbuf(nullptr, 0);
        file_.open(path, std::ios::in | std::ios::binary);
    } catch (const std::exception&) {  // no memory: the file stays closed
    }
}

bool EPFileStream::seek(std::uint64_t position) noexcept {
    try {
        const auto offset = static_cast<std::streamoff>(position);
        return file_.pubseekoff(offset, std::ios::beg, std::ios::in) != std::filebuf::pos_type(std::streamoff{-1});
    } catch (const std::exception&) {
        return false;
    }
}

std::streamsize EPFileStream::readUpTo(unsigned char* bytes, std::streamsize size) noexcept {
    try {
        return file_.sgetn(reinterpret_cast<char*>(bytes), size);
    } catch (const std::exception&) {
        return -1;
    }
}

}  // namespace ISCSI::TOOL
