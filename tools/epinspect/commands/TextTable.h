// Columns that stand below each other.
#pragma once

#include <string>
#include <utility>
#include <vector>

namespace epinspect {

class TextTable {
public:
    /// The first cell of a row is aligned to the left, the others to the right. Plain ASCII.
    void add(std::vector<std::string> cells) { rows_.push_back(std::move(cells)); }

    /// A line of its own, however long, between the rows.
    void addLine(std::string text) { rows_.push_back({std::move(text)}); }

    std::string text() const;

private:
    std::vector<std::vector<std::string>> rows_;
};

/// A number of bytes as people read it: "344 MiB".
std::string sizeText(double bytes);

}  // namespace epinspect
