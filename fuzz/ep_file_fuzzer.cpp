// Takes the input as an EP file of each kind: parse, dump, and lookups at offsets drawn from the input's end.
#include <ISCSIEPFileDAT.h>
#include <ISCSIEPFileFRI.h>
#include <ISCSIEPFileJNL.h>
#include <ISCSIEPFileMAP.h>
#include <ISCSIEPFileTBL.h>
#include <fuzzer/FuzzedDataProvider.h>

#include "Fuzz.h"
#include "etc/ISCSIQuorinStringTool.h"

using namespace ISCSI::TOOL;

namespace {

template <typename File>
void parseAndDump(const std::string& path, bool readable) {
    File file(path);
    require((file.parseFile() == 0) == readable);
    require(file.toString().find("\n================ HEAD[1] ================\n") != std::string::npos);
}

void lookUpEntries(const std::string& path, std::uint64_t index, std::uint64_t count) {
    ISCSIEPFileMAP map(path);
    ISCSIEPMapEntryInfo entry;
    std::vector<ISCSIEPMapEntryInfo> entries(1);
    unsigned long long total = 7;
    const int single = map.getMapEntry(index, entry);
    const int run = map.getMapEntries(index, count, entries);
    const bool atEnd = single == EP_ERR_READ_FAILED && map.head0Type == EP_FILE_TYPE_MAP;
    require(run == (count == 0 || atEnd ? 0 : single));
    require(run == 0 ? entries.size() <= count && entries.empty() == (count == 0 || atEnd) : entries.size() == 1);
    require(single != 0 || count == 0 || entries.at(0).toString() == entry.toString());
    const bool counted = map.getEntryCount(total) == 0;
    require(counted ? index >= total || single == 0 : total == 7 && single != 0);
}

void lookUpExtent(const std::string& path, std::uint64_t index, std::uint32_t extentSize, std::uint32_t offset) {
    ISCSIEPFileDAT file(path);
    std::string data = "old";
    const int error = file.getExtentData(index, extentSize, data);
    require(error == 0 ? data.size() == 2 * std::uint64_t{extentSize} : data == "old");
    unsigned char byte = 0;
    const int part = file.getExtentBytes(index, extentSize, offset, 1, &byte);
    require(extentSize == 0 || (part == EP_ERR_BAD_ARGUMENT) == (offset >= extentSize));
    char digits[2];
    PutHexDigits(&byte, 1, digits);
    require(error != 0 || part != 0 || data.compare(2 * std::size_t{offset}, 2, digits, 2) == 0);
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
    lookUpExtent(path, index, extentSize, smallIndex);
    lookUpExtent(path, smallIndex, static_cast<std::uint32_t>(count & 0xffffffU), extentSize);
    return 0;
}
