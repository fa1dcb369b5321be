#include "store/Collector.h"

#include <fcntl.h>
#include <sys/stat.h>
#include <unistd.h>

#include <algorithm>
#include <cerrno>
#include <filesystem>
#include <tuple>

#include "JsonText.h"
#include "store/FileNames.h"
#include "store/FileSize.h"
#include "store/HostFile.h"

namespace inspection {

namespace tool = ISCSI::TOOL;

namespace {

/// What tells whether a file was changed or replaced.
auto stateOf(const struct stat& status) {
    return std::tuple(status.st_dev, status.st_ino, status.st_size, status.st_mtim.tv_sec, status.st_mtim.tv_nsec);
}

/// Makes the folders above `path`. Returns 0 or the errno value.
int makeFoldersAbove(const std::string& path) {
    std::error_code error;
    std::filesystem::create_directories(std::filesystem::path(path).parent_path(), error);
    return error.value();
}

/// A LUN as the stand-in for the platform's library reads it.
std::string listed(const tool::ISCSILUNConfInfo& record) {
    return "{\"lid\":" + std::to_string(record.lid) + ",\"extentSize\":" + std::to_string(record.extentSize) +
           ",\"size\":" + std::to_string(record.size) +
           ",\"restoreTime\":" + std::to_string(static_cast<std::int32_t>(record.restoreTime)) +
           ",\"type\":" + std::to_string(record.type) + ",\"uuid\":" + jsonText(record.uuid) +
           ",\"rootPath\":" + jsonText(record.rootPath) + ",\"name\":" + jsonText(record.name) + "}";
}

}  // namespace

Collector::Collector(Context& context, std::string folder, std::string program, std::int64_t time)
    : context_(context), folder_(std::move(folder)) {
    collection_.program = std::move(program);
    collection_.time = time;
}

void Collector::run(const Lids& lids) {
    if (!writeList()) return;
    Store store(context_, lids);
    if (!writeLuns(store.luns())) return;
    std::vector<StoreFile> files;
    store.forEachFile([&](const StoreFile& file) {
        files.push_back(file);
        allBytes_ += bytesToTake(file);
    });
    for (const StoreFile& file : files) {
        if (collect(file) == Outcome::stopped) return;
    }
}

bool Collector::finish(bool complete) {
    collection_.complete = complete;
    return writeList();
}

/// Of a data file the header block, of all others the whole.
std::uint64_t Collector::bytesToTake(const StoreFile& file) const {
    const std::uint64_t there = file.missing ? 0 : sizeOf(file.hostPath).value_or(0);
    const bool isData = file.kind->type == tool::EP_FILE_TYPE_DAT;
    return isData ? std::min<std::uint64_t>(there, tool::EP_HEADER_BLOCK_SIZE) : there;
}

/// The LUNs as the stand-in for the platform's library reads them; nothing where there are none.
bool Collector::writeLuns(const std::vector<Lun>& luns) {
    if (luns.empty()) return true;
    std::string text;
    for (const Lun& lun : luns) {
        const tool::ISCSILUNConfInfo& record = lun.record;
        if (!isUTF8(record.uuid) || !isUTF8(record.rootPath) || !isUTF8(record.name)) {
            context_.failed({{"", "LUN " + std::to_string(record.lid)},
                             0,
                             0,
                             "cannot be written to the LUN list: its name or root path is not UTF-8"});
            continue;
        }
        text += (text.empty() ? "[\n" : ",\n") + listed(record);
        ++luns_;
    }
    const std::string path = folder_ + lunListPath;
    int error = makeFoldersAbove(path);
    if (error == 0) error = writeWhole(path, (text.empty() ? "[" : text) + "\n]\n");
    return error == 0 || cannotWrite(path, error) == Outcome::taken;
}

Collector::Outcome Collector::collect(const StoreFile& file) {
    const std::string copyPath = folder_ + file.path;
    if (file.missing && !file.link) return Outcome::taken;
    const int error = makeFoldersAbove(copyPath);
    if (error != 0) return cannotWrite(copyPath, error);
    if (file.missing) {  // a link that leads nowhere stays one
        std::error_code failure;
        std::filesystem::create_symlink(*file.link, copyPath, failure);
        return failure ? cannotWrite(copyPath, failure.value()) : Outcome::taken;
    }
    CollectedFile collected;
    const Outcome outcome = copy(file, copyPath, collected);
    if (outcome == Outcome::unreadable) unlink(copyPath.c_str());
    if (outcome != Outcome::taken) return outcome;
    collection_.files.push_back(collected);
    return writeList() ? Outcome::taken : Outcome::stopped;
}

/// Copies a file, up to three times while it changes.
Collector::Outcome Collector::copy(const StoreFile& file, const std::string& copyPath, CollectedFile& collected) {
    constexpr int mostTries = 3;
    if (linkToCopy(file, copyPath, collected)) return Outcome::taken;
    for (int tries = 1; tries <= mostTries; ++tries) {
        const Outcome outcome = copyOnce(file, copyPath, collected);
        if (outcome != Outcome::taken) return outcome;
        if (!collected.changed) return Outcome::taken;
    }
    context_.remark(file.path, "has changed while it was read");
    return Outcome::taken;
}

/// A file that has been copied under another name becomes a second name of that copy.
bool Collector::linkToCopy(const StoreFile& file, const std::string& copyPath, CollectedFile& collected) {
    struct stat status = {};
    if (stat(file.hostPath.c_str(), &status) != 0) return false;
    const auto known = copies_.find({status.st_dev, status.st_ino});
    if (known == copies_.end() || link((folder_ + known->second.path).c_str(), copyPath.c_str()) != 0) return false;
    collected = known->second;
    collected.path = file.path;
    return true;
}

Collector::Outcome Collector::copyOnce(const StoreFile& file, const std::string& copyPath, CollectedFile& collected) {
    const auto cannotRead = [&](int error, int reason) {
        context_.failed({{file.path, ""}, error, reason, {}});
        return Outcome::unreadable;
    };
    const Descriptor from(open(file.hostPath.c_str(), O_RDONLY | O_CLOEXEC));
    struct stat before = {};
    if (!from.isOpen() || fstat(from.number(), &before) != 0) return cannotRead(tool::EP_ERR_OPEN_FAILED, errno);
    Descriptor to(open(copyPath.c_str(), O_WRONLY | O_CREAT | O_TRUNC | O_CLOEXEC, 0666));
    if (!to.isOpen()) return cannotWrite(copyPath, errno);
    const std::uint64_t taken = bytesToTake(file);
    const std::uint64_t size = context_.sizeOf(file.hostPath).value_or(taken);
    const CopyEnd end = copySparse(from.number(), to.number(), taken, [&](std::uint64_t position) {
        context_.progress("bytes", std::min(bytes_ + position, allBytes_), allBytes_);
        return !context_.interrupted();
    });
    if (end.how == CopyEnd::How::writeFailed) return cannotWrite(copyPath, end.reason);
    if (end.how == CopyEnd::How::stopped) return Outcome::stopped;
    struct stat after = {};
    collected = {file.path, size, taken, stat(file.hostPath.c_str(), &after) != 0 || stateOf(before) != stateOf(after)};
    if (end.how == CopyEnd::How::readFailed && !(collected.changed && end.reason == 0)) {
        return cannotRead(tool::EP_ERR_READ_FAILED, end.reason);
    }
    const struct timespec times[] = {before.st_mtim, before.st_mtim};
    if (futimens(to.number(), times) != 0) return cannotWrite(copyPath, errno);
    const int closing = to.close();
    if (closing != 0) return cannotWrite(copyPath, closing);
    struct stat copied = {};
    if (stat(copyPath.c_str(), &copied) == 0) collected.taken = static_cast<std::uint64_t>(copied.st_size);
    bytes_ += collected.changed ? 0 : taken;
    copies_[{before.st_dev, before.st_ino}] = collected;
    return Outcome::taken;
}

bool Collector::writeList() {
    const int error = collection_.write(folder_);
    return error == 0 || cannotWrite(pathIn(folder_, Collection::listName), error) == Outcome::taken;
}

Collector::Outcome Collector::cannotWrite(const std::string& path, int reason) {
    context_.failed({{path, ""}, 0, reason, "cannot be written"});
    return Outcome::stopped;
}

}  // namespace inspection
