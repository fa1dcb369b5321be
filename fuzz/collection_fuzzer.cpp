// Takes the input as the list of a collection's files, collection.json.
#include <filesystem>
#include <fstream>
#include <variant>

#include "Fuzz.h"
#include "store/Collection.h"

namespace {

using inspection::Collection;

/// The folder of a collection with the head of a data file in it, gone at the end of the program.
struct Folder {
    Folder() {
        require(mkdtemp(path.data()) != nullptr);
        std::filesystem::create_directories(path + "/volume1/@iSCSI/EP");
        std::ofstream(dataFile()) << std::string(100, 'd');
    }
    ~Folder() { std::filesystem::remove_all(path); }

    std::string dataFile() const { return path + "/volume1/@iSCSI/EP/EP_DAT_00000"; }

    std::string path = (std::filesystem::temp_directory_path() / "epfuzzXXXXXX").string();
};

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
    static const Folder folder;
    const auto read = Collection::read(folder.path, inputFile(bytes, size));
    const auto* collection = std::get_if<Collection>(&read);
    if (collection == nullptr) {
        require(!std::get<inspection::Failure>(read).what.empty());
        return 0;
    }
    require(collection->sizeOf(folder.dataFile()).value_or(100) >= 100);
    // Written and read again, it is the same.
    require(collection->write(folder.path) == 0);
    const auto again = Collection::read(folder.path, folder.path + "/" + Collection::listName);
    const auto& same = std::get<Collection>(again);
    require(same.time == collection->time && same.program == collection->program);
    require(same.complete == collection->complete && same.files.size() == collection->files.size());
    for (std::size_t i = 0; i < same.files.size(); ++i) {
        const auto &one = same.files[i], &other = collection->files[i];
        require(one.path == other.path && one.size == other.size && one.taken == other.taken);
        require(one.changed == other.changed);
    }
    return 0;
}
