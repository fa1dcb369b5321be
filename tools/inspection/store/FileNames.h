// The names of EP files, and what they say.
#pragma once

#include <cstdint>
#include <optional>
#include <string>
#include <string_view>

namespace inspection {

/// The last part of a path.
inline std::string_view lastName(std::string_view path) { return path.substr(path.rfind('/') + 1); }

/// The path of what is called `name` in `folder`.
inline std::string pathIn(const std::string& folder, std::string_view name) {
    return std::string(folder).append("/").append(name);
}

/// Whether a path ends in the name of a data file, whatever follows its prefix.
bool isDataFileName(std::string_view path);

/// Whether a path ends in such a name, but not as the target writes it: "EP_DAT_1".
bool isMisnamed(std::string_view path);

/// The number in the name of a data file, without or with folders; nothing where there is none.
std::optional<std::uint64_t> dataFileNumberIn(std::string_view path);

/// The name of the data file `number`, without folders.
std::string dataFileName(std::uint64_t number);

/// What the name of a LUN's map file is made of.
struct MapName {
    std::string typeName;
    std::string uuid;
    std::string name;
};

/// The parts of the map file name `fileName` (without folders). Nothing where it has no UUID of 36 characters or not
/// the usual end: its parts cannot be told apart then.
std::optional<MapName> mapNameIn(std::string_view fileName);

/// The number in the name of a volume's folder, 0 when it is not "volume" and a number in plain form.
std::uint32_t volumeIn(std::string_view name);

}  // namespace inspection
