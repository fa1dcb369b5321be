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

void lookUp(const std::string& path, std::uint64_t index, std::uint64_t count, std::uint32_t extentSize) {
    ISCSIEPFileMAP map(path);
    ISCSIEPMapEntryInfo entry;
    std::vector<ISCSIEPMapEntryInfo> entries(1);
    const int single = map.getMapEntry(index, entry);
    const int run = map.getMapEntries(index, count, entries);
    require(run == (count == 0 ? 0 : single) && (run == 0 ? entries.size() <= count : entries.size() == 1));
    require(single != 0 || count == 0 || entries.at(0).toString() == entry.toString());
    std::string data = "old";
    const int error = ISCSIEPFileDAT(path).getExtentData(index, extentSize, data);
    require(error == 0 ? data.size() == 2 * std::uint64_t{extentSize} : data == "old");
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
    lookUp(path, index, count, extentSize);
    lookUp(path, smallIndex, count, static_cast<std::uint32_t>(count & 0xffffffU));
    return 0;
}
