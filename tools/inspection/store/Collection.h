// A collection: what is needed to look at a store elsewhere, without its data. Beside the files it holds, the file
// "collection.json" in its folder says when it was made and how much of each file was taken.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <utility>
#include <variant>
#include <vector>

#include "Failure.h"

namespace inspection {

/// A file of a collection.
struct CollectedFile {
    std::string path;         ///< on the target
    std::uint64_t size = 0;   ///< of the file there
    std::uint64_t taken = 0;  ///< how many of its bytes, from the start, the collection holds
    bool changed = false;     ///< while it was read
};

/// The message for bytes that the target has and the collection has not.
inline constexpr const char* notCollectedText = "not in the collection, which holds no data";

class Collection {
public:
    std::int64_t time = 0;  ///< when it was made, seconds since 1970-01-01 00:00:00 UTC
    std::string program;    ///< what made it, with its version
    bool complete = false;  ///< whether it came to its end, and everything could be read
    std::vector<CollectedFile> files;

    /// The name of the file in its folder.
    static constexpr const char* listName = "collection.json";

    /// Reads the collection in `folder` from the file `list`, which has that name there. Returns it, or the failure
    /// when it cannot be read or does not fit the files.
    static std::variant<Collection, Failure> read(const std::string& folder, const std::string& list);

    /// Writes "collection.json" in `folder` anew. Returns 0 or the errno value of what failed.
    int write(const std::string& folder) const;

    /// The size that the file at `hostPath` has on the target; nothing for what was not collected.
    std::optional<std::uint64_t> sizeOf(const std::string& hostPath) const;

private:
    std::string damageIn(const std::string& folder);

    std::map<std::pair<std::uint64_t, std::uint64_t>, std::uint64_t>
        sizes_;  ///< by device and inode, of files not taken whole
};

}  // namespace inspection
