#include "commands/MapChart.h"

#include <algorithm>

#include "frame/Output.h"

namespace epinspect {

namespace {

constexpr std::uint64_t maxRows = 16;

/// Shades by share of mapped entries: none, under a third, under two thirds, most, all.
using Shades = const char* const[5];
constexpr Shades blocks = {"·", "░", "▒", "▓", "█"};
constexpr Shades letters = {".", "-", "+", "*", "#"};
constexpr Shades meanings = {"none", "<1/3", "<2/3", "most", "all"};

unsigned int shadeOf(std::uint64_t mapped, std::uint64_t entries) {
    if (mapped == 0) return 0;
    return 1 + static_cast<unsigned int>(3 * mapped / entries);  // 4 where all are
}

}  // namespace

MapChart::MapChart(std::uint64_t first, std::uint64_t count, unsigned int width)
    : first_(first), width_(width), labelWidth_(std::to_string(first + count).size()) {
    constexpr std::uint64_t frame = 3;  // " |" and "|"
    rowCells_ = std::max<std::uint64_t>(width, labelWidth_ + frame + 1) - labelWidth_ - frame;
    const std::uint64_t cells = maxRows * rowCells_;
    cellSize_ = std::max<std::uint64_t>(count / cells + (count % cells > 0 ? 1 : 0), 1);
}

void MapChart::add(bool mapped, std::uint64_t count) {
    while (count > 0) {
        const auto free = cellSize_ - entries_ % cellSize_;
        const auto part = std::min(count, free);
        if (free == cellSize_) mapped_.push_back(0);
        mapped_.back() += mapped ? part : 0;
        entries_ += part;
        count -= part;
    }
}

std::string MapChart::draw(bool unicode) const {
    const Shades& shades = unicode ? blocks : letters;
    std::string text;
    for (std::size_t cell = 0; cell < mapped_.size(); ++cell) {
        const std::uint64_t start = cell * cellSize_;
        if (cell % rowCells_ == 0) {
            const std::string label = std::to_string(first_ + start);
            text.append(labelWidth_ - label.size(), ' ').append(label).append(" |");
        }
        text.append(shades[shadeOf(mapped_[cell], std::min(cellSize_, entries_ - start))]);
        if ((cell + 1) % rowCells_ == 0 || cell + 1 == mapped_.size()) text.append("|\n");
    }
    text += wrapped("One cell: " + std::to_string(cellSize_) + (cellSize_ == 1 ? " entry" : " entries"), width_, 0);
    std::string legend = "Mapped: ";
    for (std::size_t i = 0; i < std::size(meanings); ++i) {
        legend.append(i == 0 ? "" : "  ").append(shades[i]).append(" ").append(meanings[i]);
    }
    return text + wrapped(legend, width_, 8, "  ");
}

}  // namespace epinspect
