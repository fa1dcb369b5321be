// The data files of a volume, and what lies in them.
#pragma once

#include <cstdint>
#include <map>
#include <optional>
#include <string>
#include <string_view>

#include "Session.h"

namespace epinspect {

/// The number in the name of a data file, without or with folders; nothing where there is none.
std::optional<std::uint64_t> dataFileNumberIn(std::string_view path);

/// Knows the data files of one volume by their numbers.
class VolumeData {
public:
    enum class State { missing, unreadable, readable };

    /// Of the volume on which the file at `path` of the target lies. With `reports`, what cannot be read is reported;
    /// else it has been, or will be.
    VolumeData(Session& session, const std::string& path, bool reports);

    /// Whether the path names a volume, and whether its data files could be listed.
    bool haveVolume() const { return !folder_.empty(); }
    bool areListed() const { return listed_; }

    /// The file `number`, and how many bytes it holds from its data start offset on.
    State find(std::uint64_t number, std::uint64_t& bytes);

    /// The file's name without folders.
    static std::string nameOf(std::uint64_t number);

private:
    struct File {
        std::optional<State> state;  ///< once it has been looked at
        std::uint64_t bytes = 0;
    };

    void list();
    void look(std::uint64_t number, File& file);

    Session& session_;
    bool reports_;
    bool listed_ = false;
    std::string folder_;  ///< on the target, with a slash at its end
    std::map<std::uint64_t, File> files_;
};

}  // namespace epinspect
