#include "commands/Chart.h"

#include <algorithm>

#include "frame/Output.h"

namespace epinspect {

namespace {

constexpr std::uint64_t maxRows = 16;

/// Shades by share of filled things: none, under a third, under two thirds, most, all.
using Shades = const char* const[5];
constexpr Shades blocks = {"·", "░", "▒", "▓", "█"};
constexpr Shades letters = {".", "-", "+", "*", "#"};
constexpr const char* markedCell = "S";
constexpr Shades meanings = {"none", "<1/3", "<2/3", "most", "all"};

unsigned int shadeOf(std::uint64_t filled, std::uint64_t things) {
    if (filled == 0) return 0;
    return 1 + static_cast<unsigned int>(3 * filled / things);  // 4 where all are
}

}  // namespace

Chart::Chart(std::uint64_t first, std::uint64_t count, unsigned int width)
    : first_(first), width_(width), labelWidth_(std::to_string(first + count).size()) {
    constexpr std::uint64_t frame = 3;  // " |" and "|"
    rowCells_ = std::max<std::uint64_t>(width, labelWidth_ + frame + 1) - labelWidth_ - frame;
    const std::uint64_t cells = maxRows * rowCells_;
    cellSize_ = std::max<std::uint64_t>(count / cells + (count % cells > 0 ? 1 : 0), 1);
}

void Chart::add(bool filled, std::uint64_t count) {
    while (count > 0) {
        const auto free = cellSize_ - things_ % cellSize_;
        const auto part = std::min(count, free);
        if (free == cellSize_) filled_.push_back(0);
        filled_.back() += filled ? part : 0;
        things_ += part;
        count -= part;
    }
}

void Chart::mark(std::uint64_t first, std::uint64_t count) {
    marked_.resize(filled_.size());
    const auto start = marked_.begin() + static_cast<std::ptrdiff_t>((first - first_) / cellSize_);
    const auto last = marked_.begin() + static_cast<std::ptrdiff_t>((first - first_ + count - 1) / cellSize_);
    std::fill(start, last + 1, true);
}

std::string Chart::draw(bool unicode, const char* one, const char* several) const {
    const Shades& shades = unicode ? blocks : letters;
    std::string text;
    for (std::size_t cell = 0; cell < filled_.size(); ++cell) {
        const std::uint64_t start = cell * cellSize_;
        if (cell % rowCells_ == 0) {
            const std::string label = std::to_string(first_ + start);
            text.append(labelWidth_ - label.size(), ' ').append(label).append(" |");
        }
        const bool isMarked = cell < marked_.size() && marked_[cell];
        text.append(isMarked ? markedCell : shades[shadeOf(filled_[cell], std::min(cellSize_, things_ - start))]);
        if ((cell + 1) % rowCells_ == 0 || cell + 1 == filled_.size()) text.append("|\n");
    }
    return text + wrapped("One cell: " + counted(cellSize_, one, several), width_, 0);
}

std::string Chart::legend(bool unicode, unsigned int width, const std::string& title, const std::string& marked) {
    const Shades& shades = unicode ? blocks : letters;
    std::string text = title + ": ";
    for (std::size_t i = 0; i < std::size(meanings); ++i) {
        text.append(i == 0 ? "" : "  ").append(shades[i]).append(" ").append(meanings[i]);
    }
    if (!marked.empty()) text.append("  ").append(markedCell).append(" ").append(marked);
    return wrapped(text, width, static_cast<unsigned int>(title.size() + 2), "  ");
}

}  // namespace epinspect
