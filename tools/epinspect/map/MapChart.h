// The map as a picture.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace epinspect {

/// Counts mapped entries in cells of equal size. It need not know how many entries will come: when the cells run out,
/// they are merged in pairs.
class MapChart {
public:
    explicit MapChart(std::uint64_t firstIndex) : first_(firstIndex) {}

    void add(bool mapped);

    /// Rows of cells, each after the index it starts at, in `width` columns, and a legend; in block characters where
    /// `unicode` is set.
    std::string draw(unsigned int width, bool unicode) const;

private:
    std::uint64_t first_;
    std::uint64_t entries_ = 0;
    std::uint64_t cellSize_ = 1;  ///< entries a cell stands for
    std::vector<std::uint64_t> mapped_;
};

/// The width of the terminal that standard output is, 80 when it is none.
unsigned int terminalWidth();

/// Whether the locale's character set is UTF-8.
bool localeIsUnicode();

}  // namespace epinspect
