// Takes the input as the LUN list of the stand-in for the platform's library.
#include <kelpiscsiep.h>

#include <cstring>
#include <ctime>

#include "Fuzz.h"

/// A time at which any list is old enough to be known after it was read once.
extern "C" __attribute__((visibility("default"))) std::time_t time(std::time_t* /*result*/) { return 1LL << 40U; }

namespace {

/// The code and the record; of its exact size, so that a write past it shows.
std::pair<int, std::vector<unsigned char>> ask(const std::string& path, unsigned int lid) {
    setenv("KELPISCSIEP_LUNS", path.c_str(), 1);
    std::vector<unsigned char> record(KELPISCSI_LUN_RECORD_SIZE);
    const int error = KELPiSCSILunGetByLid(lid, 0, record.data());
    require(std::strlen(KELPiSCSIStrError(error)) > 0);
    require(error != 0 || (record[117] == 0 && record[4212] == 0 && record.back() == 0));
    return {error, record};
}

}  // namespace

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
    const std::string path = inputFile(bytes, size);
    for (const unsigned int lid : {0U, 1U, 2U}) {
        ask("/proc/self/stat", 0);  // another list, so that the one before is no longer known
        const auto read = ask(path, lid);
        require(ask(path, lid) == read);
    }
    return 0;
}
