#include "map/MapChart.h"

#include <langinfo.h>
#include <sys/ioctl.h>
#include <unistd.h>

#include <algorithm>
#include <cstring>

namespace epinspect {

namespace {

constexpr std::size_t maxCells = 1024;

/// Shades by share of mapped entries: none, under a third, under two thirds, most, all.
using Shades = const char* const[5];
constexpr Shades blocks = {"·", "░", "▒", "▓", "█"};
constexpr Shades letters = {".", "-", "+", "*", "#"};

unsigned int shadeOf(std::uint64_t mapped, std::uint64_t entries) {
    if (mapped == 0) return 0;
    if (mapped == entries) return 4;
    return 1 + static_cast<unsigned int>(3 * mapped / entries);
}

}  // namespace

void MapChart::add(bool mapped) {
    if (entries_ == cellSize_ * maxCells) {
        for (std::size_t i = 0; i < maxCells / 2; ++i) mapped_[i] = mapped_[2 * i] + mapped_[2 * i + 1];
        mapped_.resize(maxCells / 2);
        cellSize_ *= 2;
    }
    if (entries_++ % cellSize_ == 0) mapped_.push_back(0);
    mapped_.back() += mapped ? 1 : 0;
}

std::string MapChart::draw(unsigned int width, bool unicode) const {
    const Shades& shades = unicode ? blocks : letters;
    const auto labelWidth = std::to_string(first_ + entries_).size();
    std::size_t rowCells = 64;
    while (rowCells > 8 && labelWidth + 3 + rowCells > width) rowCells /= 2;
    while (labelWidth + 3 + 2 * rowCells <= width && rowCells < maxCells / 8) rowCells *= 2;

    std::string text;
    for (std::size_t cell = 0; cell < mapped_.size(); ++cell) {
        const std::uint64_t start = cell * cellSize_;
        if (cell % rowCells == 0) {
            const std::string label = std::to_string(first_ + start);
            text.append(labelWidth - label.size(), ' ').append(label).append(" |");
        }
        text.append(shades[shadeOf(mapped_[cell], std::min(cellSize_, entries_ - start))]);
        if ((cell + 1) % rowCells == 0 || cell + 1 == mapped_.size()) text.append("|\n");
    }
    text.append("One cell: ").append(std::to_string(cellSize_)).append(cellSize_ == 1 ? " entry" : " entries");
    text.append("\nMapped: ");
    text.append(shades[0]).append(" none  ").append(shades[1]).append(" <1/3  ").append(shades[2]).append(" <2/3  ");
    return text.append(shades[3]).append(" most  ").append(shades[4]).append(" all\n");
}

unsigned int terminalWidth() {
    winsize size = {};
    const bool known = ioctl(STDOUT_FILENO, TIOCGWINSZ, &size) == 0 && size.ws_col > 0;
    return known ? size.ws_col : 80;
}

bool localeIsUnicode() { return std::strcmp(nl_langinfo(CODESET), "UTF-8") == 0; }

}  // namespace epinspect
