// What the library costs, each figure beside the floor it is compared with. Run with --benchmark_filter to choose.
#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileFRI.h>
#include <ISCSIEPFileJNL.h>
#include <ISCSIEPFileMAP.h>
#include <ISCSIEPFileTBL.h>
#include <benchmark/benchmark.h>
#include <fcntl.h>
#include <unistd.h>

#include <algorithm>
#include <cstdio>
#include <cstdlib>
#include <cstring>
#include <filesystem>
#include <fstream>
#include <map>
#include <memory>
#include <string>
#include <vector>

#include "EPFileBuilder.h"

using namespace ISCSI::TOOL;
using epbuilder::EPFileBuilder;

namespace {

constexpr off_t dataStart = 24576;
constexpr std::uint64_t mapEntries = 10000000;
constexpr std::uint64_t longMapEntries = 67108864;
constexpr std::size_t extentSize = 1048576;

bool failed = false;

void fail(benchmark::State& state, const char* what) {
    failed = true;
    state.SkipWithError(what);
}

/// A folder that lives as long as the program.
const std::string& folder() {
    static const struct Folder {
        Folder() {
            if (mkdtemp(path.data()) == nullptr) std::abort();
        }
        ~Folder() { std::filesystem::remove_all(path); }
        std::string path = (std::filesystem::temp_directory_path() / "epbenchXXXXXX").string();
    } made;
    return made.path;
}

std::string write(const std::string& name, const EPFileBuilder& builder) {
    builder.write(folder() + "/" + name);
    return folder() + "/" + name;
}

template <typename File>
void parseAndDump(benchmark::State& state, const EPFileBuilder& builder) {
    const std::string path = write("file", builder);
    for (auto _ : state) {
        File file(path);
        if (file.parseFile() != 0) fail(state, "parse failed");
        benchmark::DoNotOptimize(file.toString());
    }
}

void readHeader(benchmark::State& state) {
    ISCSIEPFileTBL file(write("file", EPFileBuilder::table()));
    for (auto _ : state) {
        if (file.readHeader() != 0) fail(state, "read failed");
    }
}

void headerFloor(benchmark::State& state) {
    const std::string path = write("file", EPFileBuilder::table());
    unsigned char block[dataStart];
    for (auto _ : state) {
        const int file = open(path.c_str(), O_RDONLY);
        if (read(file, block, sizeof block) != dataStart) fail(state, "read failed");
        close(file);
        benchmark::DoNotOptimize(block);
    }
}

/// 1024 UUID texts, formatted one by one.
void uuidFloor(benchmark::State& state) {
    unsigned char b[16] = {0xa0, 0xb1, 0xc2};
    char text[37];
    for (auto _ : state) {
        for (int i = 0; i < 1024; ++i) {
            b[15] = static_cast<unsigned char>(i);
            std::snprintf(text, sizeof text, "%02x%02x%02x%02x-%02x%02x-%02x%02x-%02x%02x-%02x%02x%02x%02x%02x%02x",
                          b[0], b[1], b[2], b[3], b[4], b[5], b[6], b[7], b[8], b[9], b[10], b[11], b[12], b[13], b[14],
                          b[15]);
            benchmark::DoNotOptimize(text);
        }
    }
}

/// A map file of `count` mapped entries, whose extent addresses advance by `step`, and start again at `end`: by 1 they
/// are one run, by 2 as many runs as entries.
std::string writeMap(const std::string& name, std::uint64_t count, std::uint64_t step,
                     std::uint64_t end = std::uint64_t{1} << 48U) {
    const std::string path = write(name, EPFileBuilder::map().resize(dataStart));
    std::ofstream file(path, std::ios::binary | std::ios::app);
    std::string block;
    for (std::uint64_t i = 0; i < count; ++i) {
        block += epbuilder::littleEndian(i * step % end | 1ULL << 63U, 8);
        if (block.size() == 1U << 20U || i + 1 == count) {
            file << block;
            block.clear();
        }
    }
    return path;
}

const std::string& mapFile() {
    static const std::string path = writeMap("map", mapEntries, 1);
    return path;
}

const std::string& longMapFile() {
    static const std::string path = writeMap("long-map", longMapEntries, 1);
    return path;
}

const std::string& fragmentedMapFile() {
    static const std::string path = writeMap("fragmented-map", mapEntries, 2);
    return path;
}

void singleLookup(benchmark::State& state) {
    ISCSIEPFileMAP file(mapFile());
    ISCSIEPMapEntryInfo entry;
    std::uint64_t index = 0;
    for (auto _ : state) {
        if (file.getMapEntry(index, entry) != 0) fail(state, "lookup failed");
        index = (index + 7919) % mapEntries;
    }
    state.SetItemsProcessed(state.iterations());
}

/// Reads blocks of 64 KiB and looks at the top bit of each entry.
std::uint64_t mappedEntries(const std::string& path) {
    std::vector<unsigned char> block(65536);
    std::uint64_t mapped = 0;
    const int file = open(path.c_str(), O_RDONLY);
    lseek(file, dataStart, SEEK_SET);
    for (ssize_t got = 0; (got = read(file, block.data(), block.size())) > 0;) {
        for (ssize_t i = 7; i < got; i += 8) mapped += block[static_cast<std::size_t>(i)] >= 0x80 ? 1U : 0U;
    }
    close(file);
    return mapped;
}

void wholeMapFloor(benchmark::State& state, const std::string& (*path)(), std::uint64_t entries) {
    for (auto _ : state) {
        if (mappedEntries(path()) != entries) fail(state, "read failed");
    }
    state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(entries));
}

/// A command of the shell that goes through `items` entries or bytes, its start included. Findings (3) are no failure.
void shell(benchmark::State& state, const std::string& command, std::uint64_t items) {
    for (auto _ : state) {
        const int status = WEXITSTATUS(std::system((command + " > /dev/null").c_str()));
        if (status != 0 && status != 3) fail(state, "program failed");
    }
    state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(items));
}

/// A command on a map of `entries`, which is made when it is first needed.
void mapProgram(benchmark::State& state, const std::string& (*path)(), std::uint64_t entries, const char* command) {
    shell(state, command + (" '" + path()) + "'", entries);
}

/// A command that compares the long map with a copy of it.
void comparison(benchmark::State& state, const char* command) {
    static const std::string copy = [] {
        std::filesystem::copy_file(longMapFile(), longMapFile() + "2");
        return longMapFile() + "2";
    }();
    shell(state, command + (" '" + longMapFile()) + "' '" + copy + "'", longMapEntries);
}

constexpr std::uint64_t lunSize = std::uint64_t{512} << 20U;

/// The root of a store whose one LUN is a single run of extents; its map file is /volume1/@iSCSI/LUN/m.
const std::string& lunRoot() {
    static const std::string root = [] {
        EPFileBuilder map = EPFileBuilder::map();
        for (std::uint64_t i = 0; i < lunSize / extentSize; ++i) map.entry(i, 1ULL << 63U | i);
        write("lun/volume1/@iSCSI/LUN/m", map);
        write("lun/volume1/@iSCSI/EP/EP_DAT_00000", EPFileBuilder::data().bytes(dataStart, std::string(lunSize, 'x')));
        return folder() + "/lun";
    }();
    return root;
}

constexpr const char* scatteredMap = "space/volume1/@iSCSI/LUN/THINm_00000";
constexpr const char* scatteredData = "space/volume1/@iSCSI/EP/EP_DAT_00000";

/// The map of LUN 1 in a store of its own, whose entries use all extents of a data file of 4 TiB, each once, in an
/// order without runs.
const std::string& scatteredMapFile() {
    static const std::string path = [] {
        write(scatteredData, EPFileBuilder::data().resize(dataStart + (std::uint64_t{1} << 42U)));
        std::filesystem::create_directories(std::filesystem::path(folder() + "/" + scatteredMap).parent_path());
        std::filesystem::create_directories(folder() + "/space/var/db/iscsi");
        std::ofstream(folder() + "/space/var/db/iscsi/luns.json")
            << R"([{"lid": 1, "extentSize": 65536, "size": 4398046511104, "restoreTime": 0, "type": 7, "uuid": "",)"
            << R"("rootPath": "/volume1", "name": "m"}])";
        return writeMap(scatteredMap, longMapEntries, 40503001, longMapEntries);
    }();
    return path;
}

/// A command on that store.
void spaceProgram(benchmark::State& state, const std::string& command) {
    const std::string root = scatteredMapFile().substr(0, folder().size() + 6);
    shell(state, EPINSPECT " --root '" + root + "' " + command, longMapEntries);
}

void lunProgram(benchmark::State& state) {
    shell(state, EPINSPECT " read /volume1/@iSCSI/LUN/m --extent-size 1M --root " + lunRoot(), lunSize);
}

void ddProgram(benchmark::State& state) {
    const std::string file = lunRoot() + "/volume1/@iSCSI/EP/EP_DAT_00000";
    shell(state, "dd bs=1M status=none if=" + file, lunSize);
}

void singleLookupFloor(benchmark::State& state) {
    const std::string& path = mapFile();
    unsigned char entry[8];
    std::uint64_t index = 0;
    for (auto _ : state) {
        const int file = open(path.c_str(), O_RDONLY);
        lseek(file, dataStart + static_cast<off_t>(8 * index), SEEK_SET);
        if (read(file, entry, sizeof entry) != sizeof entry) fail(state, "read failed");
        close(file);
        benchmark::DoNotOptimize(entry);
        index = (index + 7919) % mapEntries;
    }
    state.SetItemsProcessed(state.iterations());
}

void wholeMapWalk(benchmark::State& state) {
    ISCSIEPFileMAP file(mapFile());
    std::vector<ISCSIEPMapEntryInfo> entries;
    for (auto _ : state) {
        std::uint64_t mapped = 0;
        for (std::uint64_t first = 0; first < mapEntries; first += entries.size()) {
            if (file.getMapEntries(first, 8192, entries) != 0) fail(state, "walk failed");
            for (const ISCSIEPMapEntryInfo& entry : entries) mapped += entry.mapped ? 1U : 0U;
        }
        benchmark::DoNotOptimize(mapped);
    }
    state.SetItemsProcessed(state.iterations() * static_cast<std::int64_t>(mapEntries));
}

const std::string& dataFile() {
    static const std::string path = [] {
        std::string content;
        for (std::size_t i = 0; i < 8 * extentSize; ++i) content.push_back(static_cast<char>(i * 2654435761U >> 13U));
        return write("data", EPFileBuilder::data().bytes(dataStart, content));
    }();
    return path;
}

void extent(benchmark::State& state) {
    ISCSIEPFileDAT file(dataFile());
    std::uint64_t index = 0;
    for (auto _ : state) {
        std::string data;
        if (file.getExtentData(index++ % 8, extentSize, data) != 0) fail(state, "lookup failed");
        benchmark::DoNotOptimize(data);
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(extentSize));
}

/// Open, pread into a fresh buffer, two copies of it into a fresh buffer of twice the size, close.
void extentFloor(benchmark::State& state) {
    const std::string& path = dataFile();
    off_t index = 0;
    for (auto _ : state) {
        const int file = open(path.c_str(), O_RDONLY);
        const std::unique_ptr<char[]> bytes(new char[extentSize]);
        const off_t position = dataStart + index++ % 8 * static_cast<off_t>(extentSize);
        if (pread(file, bytes.get(), extentSize, position) < 0) fail(state, "read failed");
        const std::unique_ptr<char[]> text(new char[2 * extentSize]);
        std::memcpy(text.get(), bytes.get(), extentSize);
        std::memcpy(text.get() + extentSize, bytes.get(), extentSize);
        close(file);
        benchmark::DoNotOptimize(text.get());
        benchmark::ClobberMemory();
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(extentSize));
}

/// A program of the system on the same bytes, its start and its pipe included.
void extentProgram(benchmark::State& state, const std::string& program) {
    const std::string path = folder() + "/extent";
    std::filesystem::copy_file(dataFile(), path, std::filesystem::copy_options::overwrite_existing);
    const std::string command = program + " < " + path + " > /dev/null";
    for (auto _ : state) {
        if (std::system(command.c_str()) != 0) fail(state, "program failed");
    }
    state.SetBytesProcessed(state.iterations() * static_cast<std::int64_t>(std::filesystem::file_size(path)));
}
/// Keeps the best time that each benchmark took for one entry, byte or call.
class RatioReporter : public benchmark::ConsoleReporter {
public:
    void ReportRuns(const std::vector<Run>& runs) override {
        for (const Run& run : runs) {
            if (run.run_type == Run::RT_Aggregate) continue;
            const auto items = run.counters.find("items_per_second");
            const auto bytes = run.counters.find("bytes_per_second");
            const double each = items != run.counters.end() ? 1 / items->second.value
                                : bytes != run.counters.end()
                                    ? 1 / bytes->second.value
                                    : run.real_accumulated_time / static_cast<double>(run.iterations);
            double& best = times_.emplace(run.run_name.function_name, each).first->second;
            best = std::min(best, each);
        }
    }

    void printTimes() const {
        for (const auto& [name, time] : times_) {
            std::printf("%-70s %10.3f ns\n", (name + ", one call, entry or byte").c_str(), time * 1e9);
        }
    }

    void printRatio(const std::string& what, const std::string& of, const std::string& to) const {
        if (times_.count(of) == 0 || times_.count(to) == 0) return;
        std::printf("%-70s %8.2f\n", what.c_str(), times_.at(of) / times_.at(to));
    }

private:
    std::map<std::string, double> times_;
};

}  // namespace

int main(int argc, char** argv) {
    // In turn and several times, so that a machine whose speed drifts does not favour one side; options may differ.
    std::string defaults[] = {"--benchmark_repetitions=7", "--benchmark_enable_random_interleaving=true",
                              "--benchmark_min_time=0.05"};
    std::vector<char*> arguments = {argv[0]};
    for (std::string& option : defaults) arguments.push_back(option.data());
    arguments.insert(arguments.end(), argv + 1, argv + argc);
    int count = static_cast<int>(arguments.size());
    benchmark::Initialize(&count, arguments.data());
    const auto add = [](const char* name, auto... inputs) {
        benchmark::RegisterBenchmark(name, inputs...)->UseRealTime();
    };
    add("header/floor", headerFloor);
    add("header/read", readHeader);
    add("header/1024 UUIDs", uuidFloor);
    add("header/table", parseAndDump<ISCSIEPFileTBL>, EPFileBuilder::table());
    add("header/free-index", parseAndDump<ISCSIEPFileFRI>, EPFileBuilder::freeIndex());
    add("header/data", parseAndDump<ISCSIEPFileDAT>, EPFileBuilder::data());
    add("header/journal", parseAndDump<ISCSIEPFileJNL>, EPFileBuilder::journal());
    add("header/map", parseAndDump<ISCSIEPFileMAP>, EPFileBuilder::map());
    add("header/map of 1024 pools", parseAndDump<ISCSIEPFileMAP>,
        EPFileBuilder::map().set(epbuilder::map::seg0PoolCount, 1024));
    add("entry/floor", singleLookupFloor);
    add("entry/single", singleLookup);
    add("entry/walk", wholeMapWalk);
    add("entry/walk floor", wholeMapFloor, mapFile, mapEntries);
    add("map/floor", wholeMapFloor, longMapFile, longMapEntries);
    add("map/one run", mapProgram, longMapFile, longMapEntries, EPINSPECT " map");
    add("map/fragments", mapProgram, fragmentedMapFile, mapEntries, EPINSPECT " map");
    add("map/fragments as JSON", mapProgram, fragmentedMapFile, mapEntries, EPINSPECT " map --json");
    add("map/fragments as a chart", mapProgram, fragmentedMapFile, mapEntries, EPINSPECT " map --chart");
    add("map/fragments, od", mapProgram, fragmentedMapFile, mapEntries, "od -An -v -tx8 -j24576");
    add("map/find", mapProgram, longMapFile, longMapEntries, EPINSPECT " find --pool 1");
    add("map/check", mapProgram, longMapFile, longMapEntries, EPINSPECT " check --extent-size 1M");
    add("map/check of fragments", mapProgram, fragmentedMapFile, mapEntries, EPINSPECT " check --extent-size 1M");
    add("map/scattered", mapProgram, scatteredMapFile, longMapEntries, EPINSPECT " map");
    add("map/check of scattered", spaceProgram, std::string("check"));
    add("map/usage of scattered", spaceProgram, std::string("usage"));
    add("map/owner in scattered", spaceProgram, std::string("owner /volume1/@iSCSI/EP/EP_DAT_00000 123456789012"));
    add("map/diff", comparison, EPINSPECT " diff");
    add("map/cmp", comparison, "cmp");
    add("lun/read", lunProgram);
    add("lun/dd", ddProgram);
    add("extent/floor", extentFloor);
    add("extent/library", extent);
    add("extent/basenc", extentProgram, std::string("basenc --base16 -w0"));
    add("extent/xxd", extentProgram, std::string("xxd -p"));
    add("extent/od", extentProgram, std::string("od -An -v -tx1"));

    RatioReporter reporter;
    benchmark::RunSpecifiedBenchmarks(&reporter);
    reporter.printTimes();
    std::puts("\nRatios of this run");
    for (const char* kind : {"table", "free-index", "data", "journal", "map", "map of 1024 pools"}) {
        reporter.printRatio(std::string("parse and dump, ") + kind + ": time against open, read, close",
                            std::string("header/") + kind, "header/floor");
    }
    reporter.printRatio("header block: time against open, read, close", "header/read", "header/floor");
    reporter.printRatio("parse and dump, map of 1024 pools: time against 1024 snprintf", "header/map of 1024 pools",
                        "header/1024 UUIDs");
    reporter.printRatio("single lookup: time against the bare four system calls", "entry/single", "entry/floor");
    reporter.printRatio("whole-map walk: speed per entry against single lookups", "entry/single", "entry/walk");
    reporter.printRatio("whole-map walk: time against looking at the top bits", "entry/walk", "entry/walk floor");
    reporter.printRatio("epinspect map --json of fragments: time against its text", "map/fragments as JSON",
                        "map/fragments");
    reporter.printRatio("epinspect map of fragments: speed against od", "map/fragments, od", "map/fragments");
    reporter.printRatio("epinspect find: time against map", "map/find", "map/one run");
    reporter.printRatio("epinspect check: time against map", "map/check", "map/one run");
    reporter.printRatio("epinspect check of fragments: time against map", "map/check of fragments", "map/fragments");
    for (const char* command : {"check of", "usage of", "owner in"}) {
        reporter.printRatio(std::string("epinspect ") + command + " scattered extents: time against map",
                            std::string("map/") + command + " scattered", "map/scattered");
    }
    reporter.printRatio("epinspect diff: time against map", "map/diff", "map/one run");
    reporter.printRatio("epinspect diff: speed against cmp", "map/cmp", "map/diff");
    reporter.printRatio("epinspect read of a long run: speed against dd bs=1M", "lun/dd", "lun/read");
    for (const char* map : {"one run", "fragments", "fragments as JSON", "fragments as a chart"}) {
        reporter.printRatio(std::string("epinspect map, ") + map + ": time per entry against looking at the top bits",
                            std::string("map/") + map, "map/floor");
    }
    reporter.printRatio("extents of 1 MiB: speed against the copy floor", "extent/floor", "extent/library");
    for (const char* program : {"basenc", "xxd", "od"}) {
        reporter.printRatio(std::string("extents of 1 MiB: speed against ") + program, std::string("extent/") + program,
                            "extent/library");
    }
    return failed ? 1 : 0;
}
