// The data files of a volume: which there are, and what can be read of them.
#pragma once

#include <ISCSIEPFileDAT.h>

#include <cstdint>
#include <map>
#include <memory>
#include <optional>
#include <set>
#include <string>

#include "store/ChangeWatch.h"
#include "store/Context.h"
#include "store/FileSize.h"

namespace inspection {

/// A data file, or why nothing can be read of it.
struct DataFile {
    std::string path;  ///< on the target; empty when the map file's path names no volume
    std::unique_ptr<ISCSI::TOOL::ISCSIEPFileDAT> file;  ///< its HEAD[0] is decoded, its type that of a data file
    std::uint64_t size = 0;                             ///< bytes of the file
    std::uint64_t dataSize = 0;                         ///< bytes from the data start offset to the end
    std::uint64_t held = 0;                             ///< how many of these lie here: of a collection fewer
    bool missing = false;                               ///< nothing lies there
    std::optional<Failure> failure;                     ///< without a part; `file` is then null

    std::optional<ChangeWatch> watch;  ///< where somebody asks for changes

    FileState state;         ///< of what lay there when it was opened
    unsigned int looks = 0;  ///< how often DataFiles had been told to look again
};

/// The data files of one volume. Opens each of them when it is asked for, and keeps those that were, up to a limit.
class DataFiles {
public:
    /// Of the volume on which the file at `path` of the target lies. With `remarks` there is a remark about each data
    /// file whose data start is doubtful, and about each that changes.
    DataFiles(Context& context, const std::string& path, bool remarks);

    /// The data file `number`. The reference holds until the next call.
    const DataFile& at(std::uint64_t number);

    /// From now on what at() gives is as it lies there now, looked at once for each file.
    void lookAgain() { ++looks_; }

    /// Tells the context which of those that were opened have changed since.
    void noticeChanges() const;

    /// Lists the volume's folder, once: from then on a data file that it does not hold costs no look. False when that
    /// cannot be done, or when the path names no volume; error() then says why.
    bool list();
    const std::optional<Failure>& error() const { return listError_; }

private:
    DataFile open(std::uint64_t number);
    bool isAsOpened(const DataFile& data) const;
    bool isListedMissing(std::uint64_t number) const;

    Context& context_;
    std::string path_;
    bool remarks_;
    std::map<std::uint64_t, DataFile> files_;  ///< by number
    unsigned int looks_ = 0;
    bool listTried_ = false;
    std::optional<std::set<std::uint64_t>> listed_;
    std::optional<Failure> listError_;
};

}  // namespace inspection
