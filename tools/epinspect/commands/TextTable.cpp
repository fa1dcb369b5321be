#include "commands/TextTable.h"

#include <algorithm>
#include <cstddef>
#include <cstdio>
#include <iterator>

namespace epinspect {

std::string TextTable::text() const {
    std::vector<std::size_t> widths;
    for (const auto& row : rows_) {
        if (row.size() == 1) continue;
        widths.resize(std::max(widths.size(), row.size()));
        for (std::size_t i = 0; i < row.size(); ++i) widths[i] = std::max(widths[i], row[i].size());
    }
    std::string text;
    for (const auto& row : rows_) {
        for (std::size_t i = 0; i < row.size(); ++i) {
            const std::size_t width = row.size() == 1 ? 0 : widths[i];
            const std::string gap(width - std::min(width, row[i].size()), ' ');
            text += i == 0 ? row[i] + gap : "  " + gap + row[i];
        }
        text.erase(text.find_last_not_of(' ') + 1);
        text += "\n";
    }
    return text;
}

std::string sizeText(double bytes) {
    static constexpr const char* units[] = {"B", "KiB", "MiB", "GiB", "TiB", "PiB", "EiB", "ZiB", "YiB"};
    constexpr double step = 1024;
    std::size_t unit = 0;
    for (; bytes >= step && unit + 1 < std::size(units); ++unit) bytes /= step;
    char text[32];
    std::snprintf(text, sizeof text, "%.*f %s", unit > 0 && bytes < 10 ? 1 : 0, bytes, units[unit]);
    return text;
}

}  // namespace epinspect
