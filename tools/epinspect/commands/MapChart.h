// The map as a picture.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace epinspect {

/// Counts the mapped ones of `count` entries from index `first` on in cells of equal size, and draws them.
class MapChart {
public:
    /// For a picture `width` columns wide.
    MapChart(std::uint64_t first, std::uint64_t count, unsigned int width);

    /// The next `count` entries are mapped, or are not.
    void add(bool mapped, std::uint64_t count);

    /// Rows of cells, each after the index it starts at, and a legend; in block characters where `unicode` is set.
    std::string draw(bool unicode) const;

private:
    std::uint64_t first_;
    unsigned int width_;
    std::size_t labelWidth_;
    std::uint64_t rowCells_;
    std::uint64_t cellSize_;             ///< entries a cell stands for
    std::uint64_t entries_ = 0;          ///< how many have been added
    std::vector<std::uint64_t> mapped_;  ///< of each cell
};

}  // namespace epinspect
