// Takes the input as an EP file of each kind: parse, dump, and lookups at offsets drawn from the input's end.
#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileFRI.h>
#include <ISCSIEPFileJNL.h>
#include <ISCSIEPFileMAP.h>
#include <ISCSIEPFileTBL.h>
#include <fuzzer/FuzzedDataProvider.h>

#include "Fuzz.h"

using namespace ISCSI::TOOL;

namespace {

template <typename File>
void parseAndDump(const std::string& path, bool readable) {
    File file(path);
    MemoryFile::require((file.parseFile() == 0) == readable);
    MemoryFile::require(file.toString().find("\n================ HEAD[1] ================\n") != std::string::npos);
}

void lookUpEntries(const std::string& path, std::uint64_t index, std::uint64_t count) {
    ISCSIEPFileMAP file(path);
    ISCSIEPMapEntryInfo entry;
    std::vector<ISCSIEPMapEntryInfo> entries(1);
    const int single = file.getMapEntry(index, entry);
    const int run = file.getMapEntries(index, count, entries);
    MemoryFile::require(run == (count == 0 ? 0 : single));
    MemoryFile::require(run == 0 ? entries.size() <= count : entries.size() == 1);
    if (single == 0 && count > 0) MemoryFile::require(entries.at(0).toString() == entry.toString());
}

void lookUpExtent(const std::string& path, std::uint64_t index, std::uint32_t size) {
    ISCSIEPFileDAT file(path);
    std::string data = "old";
    const int error = file.getExtentData(index, size, data);
    MemoryFile::require(error == 0 ? data.size() == 2 * std::uint64_t{size} : data == "old");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
    FuzzedDataProvider input(bytes, size);
    const auto index = input.ConsumeIntegral<std::uint64_t>();
    const auto count = input.ConsumeIntegral<std::uint64_t>();
    const auto smallIndex = input.ConsumeIntegral<std::uint8_t>();
    const auto extentSize = input.ConsumeIntegral<std::uint16_t>();
    const std::vector<std::uint8_t> content = input.ConsumeRemainingBytes<std::uint8_t>();
    const MemoryFile file(content);
    const bool readable = content.size() >= EP_HEADER_BLOCK_SIZE;
    parseAndDump<ISCSIEPFileTBL>(file.path(), readable);
    parseAndDump<ISCSIEPFileFRI>(file.path(), readable);
    parseAndDump<ISCSIEPFileDAT>(file.path(), readable);
    parseAndDump<ISCSIEPFileMAP>(file.path(), readable);
    parseAndDump<ISCSIEPFileJNL>(file.path(), readable);
    lookUpEntries(file.path(), index, count);
    lookUpEntries(file.path(), smallIndex, count);
    lookUpExtent(file.path(), index, extentSize);
    lookUpExtent(file.path(), smallIndex, static_cast<std::uint32_t>(count & 0xffffffU));
    return 0;
}
