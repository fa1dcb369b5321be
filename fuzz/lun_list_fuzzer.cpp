// Takes the input as the LUN list of the stand-in for the platform's library.
#include <kelpiscsiep.h>

#include <cstring>

#include "Fuzz.h"

extern "C" int LLVMFuzzerTestOneInput(const std::uint8_t* bytes, std::size_t size) {
    setenv("KELPISCSIEP_LUNS", inputFile(bytes, size).c_str(), 1);
    std::vector<unsigned char> record(KELPISCSI_LUN_RECORD_SIZE);  // of its exact size, so that a write past it shows
    for (const unsigned int lid : {0U, 1U, 2U}) {
        const int error = KELPiSCSILunGetByLid(lid, 0, record.data());
        require(std::strlen(KELPiSCSIStrError(error)) > 0);
        require(error != 0 || (record[117] == 0 && record[4212] == 0 && record.back() == 0));
    }
    return 0;
}
