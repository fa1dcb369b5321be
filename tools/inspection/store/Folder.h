// What lies in a folder of the target.
#pragma once

#include <filesystem>
#include <string>
#include <system_error>

#include "store/Context.h"

namespace inspection {

/// Calls each(entry) for what lies in the folder at `path` of the target, which may be missing. Returns why it could
/// not be listed to its end; only a link out of the root folder is reported here.
template <typename Each>
std::error_code listFolder(Context& context, const std::string& path, Each&& each) {
    const std::optional<std::string> folder = context.openableFolder(path);
    std::error_code error;
    if (!folder) return error;
    std::filesystem::directory_iterator entry(*folder, error);
    for (; !error && entry != std::filesystem::directory_iterator(); entry.increment(error)) each(*entry);
    if (error == std::errc::no_such_file_or_directory) error.clear();
    return error;
}

}  // namespace inspection
