#include "store/DataFiles.h"

#include <etc/ISCSIEPFormat.h>

#include <algorithm>
#include <cerrno>
#include <utility>

#include "store/Doubts.h"
#include "store/FileNames.h"
#include "store/Folder.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

DataFiles::DataFiles(Context& context, const std::string& path, bool remarks)
    : context_(context), path_(path), remarks_(remarks) {}

const DataFile& DataFiles::at(std::uint64_t number) {
    constexpr std::size_t mostFiles = 64;  // 256 TiB; what a file takes is mainly its header block
    const auto known = files_.find(number);
    if (known != files_.end() && isAsOpened(known->second)) {
        known->second.looks = looks_;
        return known->second;
    }
    if (known == files_.end() && files_.size() >= mostFiles) {
        noticeChanges();
        files_.clear();
    }
    if (known != files_.end() && known->second.watch) known->second.watch->noticeChange();
    return files_[number] = open(number);
}

void DataFiles::noticeChanges() const {
    for (const auto& [number, file] : files_) {
        if (file.watch) file.watch->noticeChange();
        if (file.missing && context_.root.locate(file.path).isThere()) context_.changed(file.path);
    }
}

bool DataFiles::isAsOpened(const DataFile& data) const {
    if (data.looks == looks_) return true;
    return !data.failure && stateOf(context_.root.hostPath(data.path)) == data.state;
}

bool DataFiles::list() {
    if (std::exchange(listTried_, true)) return listed_.has_value();
    std::string first;
    const Trial trial(context_);
    if (tool::ISCSIEPFile(path_).getDATFilePath(1, 0, first) != 0) return false;
    const std::string folder = first.substr(0, first.rfind('/') + 1);
    Listing listing = listFolder(context_, folder);
    listError_ = std::move(listing.failure);
    if (listError_) return false;
    listed_.emplace();
    for (const std::string& name : listing.names) {
        const auto number = dataFileNumberIn(name);
        if (number && !isMisnamed(name)) listed_->insert(*number);
    }
    return true;
}

bool DataFiles::isListedMissing(std::uint64_t number) const { return listed_ && listed_->count(number) == 0; }

DataFile DataFiles::open(std::uint64_t number) {
    DataFile data;
    data.looks = looks_;
    const auto failed = [&data](int error, int reason, std::string what = {}) {
        data.failure = Failure{{data.path, ""}, error, reason, std::move(what)};
        data.file.reset();
        return std::move(data);
    };
    const int pathError = tool::ISCSIEPFile(path_).getDATFilePath(1, number * tool::EP_DAT_FILE_SPAN, data.path);
    if (pathError != 0) return failed(pathError, 0);
    const Located located = context_.root.locate(data.path);
    if (auto obstacle = located.obstacleToFile(data.path)) {
        data.failure = std::move(obstacle);
        return data;
    }
    if (isListedMissing(number)) {
        data.missing = true;
        return failed(tool::EP_ERR_OPEN_FAILED, ENOENT);
    }
    data.watch.emplace(context_, data.path, located.hostPath);
    data.state = stateOf(located.hostPath);
    data.file = std::make_unique<tool::ISCSIEPFileDAT>(located.hostPath);
    // Nothing is read yet: this finds out whether there can be extents at all.
    const int error = data.file->getExtentBytes(0, 1, 0, 0, nullptr);
    const int reason = errno;
    data.missing = error == tool::EP_ERR_OPEN_FAILED && (reason == ENOENT || reason == ENOTDIR);
    if (error != 0) return failed(error, reason);
    const auto size = context_.sizeOf(located.hostPath);
    if (!size) return failed(tool::EP_ERR_OPEN_FAILED, errno);
    if (remarks_) remarkOnDataStart(context_, *data.file, data.path);
    data.size = *size;
    data.dataSize = payloadOf(*data.file, *size);
    data.held = std::min(data.dataSize, payloadOf(*data.file, sizeOf(located.hostPath).value_or(0)));
    return data;
}

}  // namespace inspection
