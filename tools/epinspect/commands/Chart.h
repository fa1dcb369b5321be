// Entries or extents as a picture.
#pragma once

#include <cstdint>
#include <string>
#include <vector>

namespace epinspect {

/// Counts those that are filled of `count` things from number `first` on, in cells of equal size, and draws them.
class Chart {
public:
    /// For a picture `width` columns wide.
    Chart(std::uint64_t first, std::uint64_t count, unsigned int width);

    /// The next `count` things are filled, or are not.
    void add(bool filled, std::uint64_t count);

    /// Marks the cells of `count` things from number `first` on, which have been added.
    void mark(std::uint64_t first, std::uint64_t count);

    /// Rows of cells, each after the number it starts at, and what a cell stands for: so many of `one` or `several`.
    /// In block characters where `unicode` is set.
    std::string draw(bool unicode, const char* one, const char* several) const;

    /// What the shades mean, after "TITLE: "; `marked` says what marked cells hold, empty where none is ever marked.
    static std::string legend(bool unicode, unsigned int width, const std::string& title, const std::string& marked);

private:
    std::uint64_t first_;
    unsigned int width_;
    std::size_t labelWidth_;
    std::uint64_t rowCells_;
    std::uint64_t cellSize_;             ///< things a cell stands for
    std::uint64_t things_ = 0;           ///< how many have been added
    std::vector<std::uint64_t> filled_;  ///< of each cell
    std::vector<bool> marked_;           ///< as far as there are marked cells
};

}  // namespace epinspect
