// Makes a collection of a store.
#pragma once

#include <cstdint>
#include <map>
#include <string>
#include <utility>
#include <vector>

#include "store/Collection.h"
#include "store/Store.h"

namespace inspection {

class Collector {
public:
    /// Collects what the context's root holds into `folder`, an empty folder of the host. `program` and `time` say who
    /// made it, and when.
    Collector(Context& context, std::string folder, std::string program, std::int64_t time);

    /// To be called once. Reports what cannot be read or written. After an interruption or a failure to write, what has
    /// been collected stays. Until finish() the collection says that it is incomplete.
    void run(const Lids& lids);

    /// To be called once, after run(): writes down whether the collection is complete. False when that cannot be
    /// written, which is reported.
    bool finish(bool complete);

    const Collection& collection() const { return collection_; }
    std::uint64_t luns() const { return luns_; }

private:
    /// How the work on a file ended.
    enum class Outcome { taken, unreadable, stopped };

    bool writeLuns(const std::vector<Lun>& luns);
    std::uint64_t bytesToTake(const StoreFile& file) const;
    Outcome collect(const StoreFile& file);
    Outcome copy(const StoreFile& file, const std::string& copyPath, CollectedFile& collected);
    Outcome copyOnce(const StoreFile& file, const std::string& copyPath, CollectedFile& collected);
    bool linkToCopy(const StoreFile& file, const std::string& copyPath, CollectedFile& collected);
    bool writeList();

    /// Reports that `path` of the collection cannot be written, and stops.
    Outcome cannotWrite(const std::string& path, int reason);

    Context& context_;
    std::string folder_;
    Collection collection_;
    std::map<std::pair<std::uint64_t, std::uint64_t>, CollectedFile> copies_;  ///< by device and inode of the original
    std::uint64_t luns_ = 0;
    std::uint64_t bytes_ = 0;  ///< copied so far
    std::uint64_t allBytes_ = 0;
};

}  // namespace inspection
