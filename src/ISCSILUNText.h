// How a LUN's type and byte counts are written, in its one-line text and in the name of its map file.
#pragma once

#include <cstdint>
#include <string>

#include "DumpText.h"

namespace ISCSI::TOOL {

/// The name of the LUN type code that equals `type`, "UNKNOWN" when there is none.
inline const char* GetLUNTypeInString(int type) {
    struct Row {
        int type;
        const char* name;
    };
    static constexpr Row rows[] = {
        {1, "BLOCK"},
        {3, "FILE"},
        {7, "THIN"},
        {15, "ADV"},
        {31, "SINK"},
        {47, "VDISK_ADV"},
        {71, "BKP_THIN"},
        {79, "BKP_ADV"},
        {143, "CINDER"},
        {259, "BLUN_THICK"},
        {263, "BLUN"},
        {275, "BLUN_THICK_SINK"},
        {279, "BLUN_SINK"},
        {291, "VDISK_BLUN_THICK"},
        {295, "VDISK_BLUN"},
        {311, "VDISK_BLUN_SINK"},
        {323, "BKP_BLUN_THICK"},
        {327, "BKP_BLUN"},
        {387, "CINDER_BLUN_THICK"},
        {391, "CINDER_BLUN"},
        {807, "VDISK_BLUN_COW"},
        {1831, "VDISK_BLUN_Q9"},
    };
    for (const Row& row : rows) {
        if (row.type == type) return row.name;
    }
    return "UNKNOWN";
}

/// A byte count in units of powers of 1024, largest first, without those of value 0: "1GB,512MB"; "0bytes" for 0.
inline std::string GetSizeInString(std::uint64_t count) {
    if (count == 0) return "0bytes";
    static constexpr const char* units[] = {"EB", "PB", "TB", "GB", "MB", "KB", "bytes"};
    std::string text;
    unsigned int shift = 60;
    for (const char* unit : units) {
        const std::uint64_t value = (count >> shift) & 1023U;
        shift -= 10;
        if (value == 0) continue;
        if (!text.empty()) text.push_back(',');
        appendNumber(text, value);
        text.append(unit);
    }
    return text;
}

}  // namespace ISCSI::TOOL
