// Takes the input as changes to the files of a small store and as arguments, and runs every walking subcommand on it.
#include <fuzzer/FuzzedDataProvider.h>

#include <filesystem>
#include <fstream>
#include <iterator>

#include "EPFileBuilder.h"
#include "Fuzz.h"
#include "Program.h"

namespace {

using epbuilder::EPFileBuilder;
namespace fs = std::filesystem;

constexpr std::size_t extentSize = 512;
const std::string names[] = {"volume1/@iSCSI/LUN/BLUNux_00000", "volume1/@iSCSI/LUN/THINuy_00000",
                             "volume1/@iSCSI/EP/EP_DAT_00000", "volume1/@iSCSI/EP/EP_TBL"};

/// The store's folder and a copy of it, gone at the end of the program, and the content of its files as they are before
/// each run.
struct Store {
    Store() {
        require(mkdtemp(root.data()) != nullptr && mkdtemp(whole.data()) != nullptr);
        EPFileBuilder map = EPFileBuilder::map().set(epbuilder::map::totalCount, 64);
        for (std::uint64_t i = 0; i < 64; ++i) map.entry(i, i % 8 == 7 ? 0 : 1ULL << 63U | i);
        map.write(root + "/" + names[0]);
        map.entry(3, 0).write(root + "/" + names[1]);
        EPFileBuilder::data().resize(epbuilder::headerBlockSize + 64 * extentSize).write(root + "/" + names[2]);
        EPFileBuilder::table().set(epbuilder::tbl::extentSize, extentSize).write(root + "/" + names[3]);
        fs::create_directories(root + "/var/db/iscsi");
        std::ofstream(root + "/var/db/iscsi/luns.json") << R"([{"lid": 1, "extentSize": 512, "size": 32768, "type": 263,
            "restoreTime": 0, "uuid": "u", "rootPath": "/volume1", "name": "x"}])";
        for (const std::string& name : names) {
            std::ifstream file(root + "/" + name, std::ios::binary);
            contents.emplace_back(std::istreambuf_iterator<char>(file), std::istreambuf_iterator<char>());
        }
        fs::copy(root, whole, fs::copy_options::recursive);
    }
    ~Store() { fs::remove_all(root), fs::remove_all(whole); }

    std::string root = (fs::temp_directory_path() / "epfuzzXXXXXX").string();
    std::string whole = root;  ///< what it is compared with
    std::vector<std::string> contents;
};

void run(std::vector<std::string> words) {
    std::vector<char*> arguments;
    for (std::string& word : words) arguments.push_back(word.data());
    arguments.push_back(nullptr);
    const int status = epinspect::runProgram(static_cast<int>(words.size()), arguments.data());
    require(status >= 0 && status <= 3);
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
    static const Store store;
    FuzzedDataProvider input(bytes, size);
    const auto number = [&input] { return std::to_string(input.ConsumeIntegral<std::uint64_t>()); };
    const std::string offset = number(), length = std::to_string(input.ConsumeIntegral<std::uint16_t>());
    const std::string small = std::to_string(input.ConsumeIntegral<std::uint8_t>()), bits = number();
    const std::string sizeOfExtents = std::to_string(input.ConsumeIntegral<std::uint32_t>());
    std::vector<std::string> contents = store.contents;
    while (input.remaining_bytes() > 0) {
        std::string& content = contents[input.ConsumeIntegralInRange<std::size_t>(0, contents.size() - 1)];
        // Only where fields and entries are.
        static constexpr std::size_t starts[] = {0, 64, 4096, 4160, 4224, 8192, 24576, 24576};
        std::size_t at =
            starts[input.ConsumeIntegralInRange<std::size_t>(0, 7)] + input.ConsumeIntegral<std::uint8_t>();
        if (input.ConsumeIntegral<std::uint8_t>() == 0) content.resize(std::min(at, content.size()));
        for (const char byte : input.ConsumeBytesAsString(8)) {
            if (at < content.size()) content[at++] = byte;
        }
    }
    for (std::size_t i = 0; i < contents.size(); ++i) {
        std::ofstream(store.root + "/" + names[i], std::ios::binary | std::ios::trunc) << contents[i];
    }
    const std::string one = "/" + names[0], other = "/" + names[1], data = "/" + names[2];
    const std::string image = store.root + "/image", collected = store.root + "/collected";
    const auto inspect = [&folder = store.root](std::vector<std::string> words) {
        words.insert(words.begin(), {"epinspect", "--root=" + folder});
        run(words);
    };
    inspect({"check", "--luns", "1-2", "--extent-size", sizeOfExtents});
    inspect({"check", "--luns", "1", "--json", one, other});
    inspect({"list", "--luns", "1-2", "--json"});
    inspect({"dump", "--json", one, data, "/" + names[3]});
    inspect({"diff", one, other});
    inspect({"diff", "--headers", "--json", one, other});
    inspect({"diff", store.whole, store.root});
    inspect({"find", "--extent", small + "-" + bits});
    inspect({"map", one, "--first", small, "--chart"});
    inspect({"entry", other, small, offset});
    inspect({"locate", "1", small, offset});
    inspect({"locate", other, offset, "--extent-size", sizeOfExtents, "--address-bits", "48"});
    inspect({"usage", "--luns", "1-2", "--extent-size", sizeOfExtents, "--chart"});
    inspect({"owner", data, "0-" + offset, small, "--extent-size", sizeOfExtents, "--json"});
    inspect({"read", "1", "--offset", small, "--length", length, "--count-from", "file"});
    inspect({"read", "1", "--output", image, "--offset", small, "--json"});
    inspect({"extent", data, small, "--extent-size", length});
    inspect({"collect", collected, "--luns", "1-2"});
    run({"epinspect", "--root", collected, "check", "--luns", "1-2"});
    run({"epinspect", "--root", collected, "read", "1", "--offset", small, "--json"});
    fs::remove(image);
    fs::remove_all(collected);
    return 0;
}
