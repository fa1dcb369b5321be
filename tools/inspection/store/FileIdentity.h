// Which file it is, under whatever name.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <tuple>

namespace inspection {

/// The same for all names of one file, and for no other file that is there at the same time.
struct FileIdentity {
    std::uint64_t device = 0;
    std::uint64_t inode = 0;

    friend bool operator==(const FileIdentity& one, const FileIdentity& other) {
        return one.device == other.device && one.inode == other.inode;
    }
    friend bool operator!=(const FileIdentity& one, const FileIdentity& other) { return !(one == other); }
    friend bool operator<(const FileIdentity& one, const FileIdentity& other) {
        return std::tie(one.device, one.inode) < std::tie(other.device, other.inode);
    }
};

/// Of what lies at `hostPath`, links followed; nothing when that cannot be found out.
std::optional<FileIdentity> identityOf(const std::string& hostPath);

}  // namespace inspection
