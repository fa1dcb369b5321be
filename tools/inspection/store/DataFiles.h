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
    std::uint64_t held = 0;                             ///< how many of these are here: in a collection fewer
    bool missing = false;                               ///< nothing lies there
    std::optional<Failure> failure;                     ///< without a part; `file` is then null

    std::optional<ChangeWatch> watch;  ///< nothing where it is missing

    FileState state;         ///< of what lay there when it was opened
    unsigned int looks = 0;  ///< how many calls of lookAgain() there had been
};

/// The data files of one volume. Opens each of them when it is asked for, and keeps those that were, up to a limit.
class DataFiles {
public:
    /// Of the volume on which the file at `path` of the target lies. With `remarks` there is a remark about each data
    /// file whose data start is doubtful.
    DataFiles(Context& context, const std::string& path, bool remarks);

    /// The data file `number`. The reference holds until the next call.
    const DataFile& at(std::uint64_t number);

    /// From now on at() looks at each file once more, and gives it as it is then.
    void lookAgain() { ++looks_; }

    /// Tells the context which of those that were asked for have changed since.
    void noticeChanges() const;

    /// Lists the volume's folder, once. From then on at() does not look for a data file that is not in it. False when
    /// the folder cannot be listed, as error() says, or when the path names no volume.
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
