// The text dumps of the files that the builder makes, typed by hand from the values it puts into their fields.
#pragma once

#include <string>

#include "Fits.h"

// clang-format off
inline const std::string uuids[] = {  // by type
    "", "10111213-1415-1617-1819-1a1b1c1d1e1f", "20212223-2425-2627-2829-2a2b2c2d2e2f",
    "30313233-3435-3637-3839-3a3b3c3d3e3f", "40414243-4445-4647-4849-4a4b4c4d4e4f",
    "c0c1c2c3-c4c5-c6c7-c8c9-cacbcccdcecf"};

inline std::string head0Dump(const std::string& type, const std::string& uuid, const std::string& dataStartOffset) {
    return "================ HEAD[0] ================\nchecksum:\t\t0xa1b2c3d\nversion:\t\t33752069\n"
        "magic code:\t\t0x1122334455667788\ntype:\t\t\t" + type + "\nUUID:\t\t\t" + uuid +
        "\ndata start offset:\t" + dataStartOffset + "\ncreate time:\t\tSun Sep 13 12:26:40 UTC 2020\n";
}

inline const char* const tableDump =
    "================ HEAD[1] ================\nchecksum:\t\t0xa1a2a3a4\nextent size:\t\t2779162536\n"
    "entry size:\t\t2846534572\ntotal count:\t\t12515133587939570612\n";

inline const char* const freeIndexDump =
    "================ HEAD[1] ================\nchecksum:\t\t0xb1b2b3b4\nentry size:\t\t3048650680\n"
    "total group count:\t0xb9babbbcbdbebfc0\n================ VAR[0]  ================\nchecksum:\t\t0xc1c2c3c4\n"
    "total free count:\t0xc5c6c7c8c9cacbcc\nindex head:\t\t14830019118758024148\n";

inline const char* const dataDump =
    "================ HEAD[1] ================\nchecksum:\t\t0xc1c2c3c4\nserial number:\t\t3318138824\n";

inline const char* const mapDump =
    "================ HEAD[1] ================\nchecksum:\t\t0xd1d2d3d4\nattribute:\t\t0xd5d6d7d8\n"
    "logic block size:\t3654999004\ntotal count:\t\t15987461884167250916\n"
    "parent UUID:\t\t50515253-5455-5657-5859-5a5b5c5d5e5f\nparent total count:\t16566183266871864300\n"
    "================ VAR[0]  ================\nchecksum:\t\t0x1122334\nmapped count:\t\t1302406798037686297\n"
    "================ VAR[1]  ================\nchecksum:\t\t0x21222324\nseg0 checksum:\t\t0x25262728\n"
    "seg0 pool count:\t2\nsession UUID:\t\t60616263-6465-6667-6869-6a6b6c6d6e6f\n"
    "promote time:\t\tSun Sep 13 12:27:40 UTC 2020\n================ VAR[2]  ================\n"
    "checksum:\t\t0x31323334\nsync count:\t\t3834312847370369852\nchild attribute:\t0x3d3e3f40\n"
    "track UUID:\t\t70717273-7475-7677-7879-7a7b7c7d7e7f\nprevious track UUID:\t80818283-8485-8687-8889-8a8b8c8d8e8f\n"
    "current track UUID:\t90919293-9495-9697-9899-9a9b9c9d9e9f\n================ SEG[0]  ================\n"
    "pool #1: a0a1a2a3-a4a5-a6a7-a8a9-aaabacadaeaf\npool #2: b0b1b2b3-b4b5-b6b7-b8b9-babbbcbdbebf\n";

inline const char* const journalDump =
    "================ HEAD[1] ================\nchecksum:\t\t0xe1e2e3e4\ntotal count:\t\t16566183266871864300\n"
    "================ VAR[0]  ================\nchecksum:\t\t0xf1f2f3f4\nshutdown tag:\t\t0xf5f6f7f8\n"
    "sync count:\t\t4193975292\n================ VAR[1]  ================\nchecksum:\t\t0x41424344\n"
    "last trans ID:\t\t1162233672\nlast record start:\t5281116304131903312\nlast flush errno:\t4227661310\n"
    "last recovery error:\t1364349780\nempty record start:\t6149198378188823388\n";
// clang-format on
