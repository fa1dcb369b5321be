// Texts compared line by line.
#pragma once

#include <gtest/gtest.h>

#include <algorithm>
#include <sstream>
#include <string>
#include <string_view>
#include <vector>

/// `expected`, each "…" in it replaced by what `text` has there. From the place on where the two differ nothing is.
inline std::string filled(std::string_view expected, std::string_view text) {
    constexpr std::string_view gap = "…";
    constexpr auto none = std::string_view::npos;
    auto end = expected.find(gap);
    if (end == none || text.substr(0, end) != expected.substr(0, end)) return std::string(expected);
    for (std::size_t done = end; end != none;) {
        expected.remove_prefix(end + gap.size());
        end = expected.find(gap);
        const auto piece = expected.substr(0, end);
        auto at = end == none ? text.size() - std::min(piece.size(), text.size() - done) : text.find(piece, done);
        if (at != none && text.substr(at, piece.size()) == piece) {
            done = at + piece.size();
            continue;
        }
        at = done;  // or where at least its first lines stand: one, two, four, so that a long text takes no longer
        std::size_t step = 1;
        for (auto line = piece.find('\n'); line != none; step *= 2) {
            const auto found = text.find(piece.substr(0, line + 1), at);
            if (found == none) break;
            at = found;
            for (auto more = step; more > 0 && line != none; --more) line = piece.find('\n', line + 1);
        }
        return std::string(text.substr(0, at)).append(at == done ? gap : "").append(expected);
    }
    return std::string(text);
}

inline std::vector<std::string> linesOf(std::string_view text) {
    std::istringstream stream(std::string(text) + "\n");
    std::vector<std::string> lines;
    for (std::string line; std::getline(stream, line);) lines.push_back(line);
    return lines;
}

/// A line as a message shows it: a part of it, control characters escaped.
inline std::string partOf(std::string_view line, std::size_t from) {
    static constexpr char digits[] = "0123456789abcdef";
    std::string text = from == 0 ? "" : "[...]";
    for (const char c : line.substr(std::min(from, line.size()), 300)) {
        const auto byte = static_cast<unsigned char>(c);
        const char escaped[] = {'\\', 'x', digits[byte / 16], digits[byte % 16], '\0'};
        text += byte >= ' ' && byte != 127 ? std::string(1, c) : c == '\t' ? "\\t" : escaped;
    }
    return text + (line.size() > from + 300 ? "[...]\n" : "\n");
}

/// Whether `text` is `expected`, in which "…" stands for anything; if not, shows the lines that differ.
inline testing::AssertionResult fits(std::string_view text, std::string_view expected) {
    const std::string whole = filled(expected, text);
    if (whole == text) return testing::AssertionSuccess();
    const auto wanted = linesOf(whole), got = linesOf(text);
    std::size_t first = 0, wantedEnd = wanted.size(), gotEnd = got.size(), told = 0;
    while (first < std::min(wantedEnd, gotEnd) && wanted[first] == got[first]) ++first;
    for (; std::min(wantedEnd, gotEnd) > first && wanted[wantedEnd - 1] == got[gotEnd - 1]; --gotEnd) --wantedEnd;
    auto result = testing::AssertionFailure() << "- expected, + got\n";
    for (auto i = first - std::min<std::size_t>(first, 2); i < first; ++i) result << "  " << partOf(got[i], 0);
    for (auto i = first; i < std::max(wantedEnd, gotEnd); ++i) {
        const std::string one = i < wantedEnd ? wanted[i] : "", other = i < gotEnd ? got[i] : "";
        if (i < std::min(wantedEnd, gotEnd) && one == other) continue;
        if (++told > 5) return result << "and more\n";
        const auto end = std::mismatch(one.begin(), one.end(), other.begin(), other.end()).first;
        const auto from = std::max<std::ptrdiff_t>(end - one.begin(), 100) - 100;
        result << "line " + std::to_string(i + 1) + "\n";
        if (i < wantedEnd) result << "- " << partOf(one, static_cast<std::size_t>(from));
        if (i < gotEnd) result << "+ " << partOf(other, static_cast<std::size_t>(from));
    }
    return result;
}
