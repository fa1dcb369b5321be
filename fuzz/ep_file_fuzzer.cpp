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
    require((file.parseFile() == 0) == readable);
    require(file.toString().find("\n================ HEAD[1] ================\n") != std::string::npos);
}

void lookUpEntries(const std::string& path, std::uint64_t index, std::uint64_t count) {
    ISCSIEPFileMAP file(path);
    ISCSIEPMapEntryInfo entry;
    std::vector<ISCSIEPMapEntryInfo> entries(1);
    const int single = file.getMapEntry(index, entry);
    const int run = file.getMapEntries(index, count, entries);
    require(run == (count == 0 ? 0 : single));
    require(run == 0 ? entries.size() <= count : entries.size() == 1);
    if (single == 0 && count > 0) require(entries.at(0).toString() == entry.toString());
}

void lookUpExtent(const std::string& path, std::uint64_t index, std::uint32_t size) {
    ISCSIEPFileDAT file(path);
    std::string data = "old";
    const int error = file.getExtentData(index, size, data);
    require(error == 0 ? data.size() == 2 * std::uint64_t{size} : data == "old");
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
    FuzzedDataProvider input(bytes, size);
    const auto index = input.ConsumeIntegral<std::uint64_t>();
    const auto count = input.ConsumeIntegral<std::uint64_t>();
    const auto smallIndex = input.ConsumeIntegral<std::uint8_t>();
    const auto extentSize = input.ConsumeIntegral<std::uint16_t>();
    const std::vector<std::uint8_t> content = input.ConsumeRemainingBytes<std::uint8_t>();
    const std::string path = inputFile(content.data(), content.size());
    const bool readable = content.size() >= EP_HEADER_BLOCK_SIZE;
    parseAndDump<ISCSIEPFileTBL>(path, readable);
    parseAndDump<ISCSIEPFileFRI>(path, readable);
    parseAndDump<ISCSIEPFileDAT>(path, readable);
    parseAndDump<ISCSIEPFileMAP>(path, readable);
    parseAndDump<ISCSIEPFileJNL>(path, readable);
    lookUpEntries(path, index, count);
    lookUpEntries(path, smallIndex, count);
    lookUpExtent(path, index, extentSize);
    lookUpExtent(path, smallIndex, static_cast<std::uint32_t>(count & 0xffffffU));
    return 0;
}
