// A set of extents of a volume, by their addresses: pages of bits. Its memory follows the space that the extents span,
// not the number of runs, and a page whose extents are all in the set takes none for its bits.
#pragma once

#include <algorithm>
#include <array>
#include <cstddef>
#include <cstdint>
#include <limits>
#include <memory>
#include <unordered_map>
#include <utility>
#include <vector>

namespace inspection {

/// How much memory the sets of one work may take together, so that extents at wild addresses are refused before the
/// machine runs out.
class ExtentMemory {
public:
    /// A quarter of the machine's memory, at most 1 GiB.
    ExtentMemory();
    explicit ExtentMemory(std::uint64_t bytes) : all_(bytes), left_(bytes) {}

    /// Throws std::bad_alloc when not as much is left.
    void take(std::uint64_t bytes);
    void give(std::uint64_t bytes) { left_ += bytes; }

    /// What is taken.
    std::uint64_t taken() const { return all_ - left_; }

private:
    std::uint64_t all_;
    std::uint64_t left_;
};

/// Extent addresses are below 2^52. Every operation that adds may throw std::bad_alloc; the set is then to be dropped.
class ExtentSet {
public:
    explicit ExtentSet(ExtentMemory& memory) : memory_(memory) {}
    ExtentSet(const ExtentSet&) = delete;
    ExtentSet& operator=(const ExtentSet&) = delete;
    ~ExtentSet() { clear(); }

    /// Adds the `count` extents from `first` on; those that were in the set already are added to `repeated` too, unless
    /// that is null.
    void add(std::uint64_t first, std::uint64_t count, ExtentSet* repeated);

    /// The same with some extents by themselves.
    template <std::size_t most>
    void add(const std::array<std::uint64_t, most>& extents, std::size_t count, ExtentSet* repeated);

    /// The same with all extents of another set.
    void add(const ExtentSet& other, ExtentSet* repeated);

    void clear();

    /// How many there are.
    std::uint64_t size() const { return size_; }

    /// How many of another set's extents are in this one too.
    std::uint64_t countCommon(const ExtentSet& other) const;

    /// Calls visit(first, count) for the runs of those of the set among the `count` extents from `first` on, in their
    /// order. A run may come in several parts.
    template <typename Visit>
    void forEachIn(std::uint64_t first, std::uint64_t count, Visit&& visit) const;

    /// The same for all of the set.
    template <typename Visit>
    void forEach(Visit&& visit) const {
        forEachIn(0, std::numeric_limits<std::uint64_t>::max(), visit);
    }

private:
    using Word = std::uint64_t;
    static constexpr unsigned int wordBits = 64;
    static constexpr std::uint64_t pageExtents = 16384;
    static constexpr std::uint64_t mostNear = 65536;
    using Bits = std::array<Word, pageExtents / wordBits>;

    struct Page {
        std::unique_ptr<Bits> bits;  ///< null while all of its extents are in the set, or none
        std::uint32_t count = 0;     ///< of its extents in the set
    };

    /// Bits `first` to `first + count - 1` of a word.
    static Word mask(unsigned int first, std::uint64_t count) {
        return (count >= wordBits ? ~Word{0} : (Word{1} << count) - 1) << first;
    }

    Page& pageAt(std::uint64_t number) {
        return number < near_.size() ? near_[static_cast<std::size_t>(number)] : makePage(number);
    }
    Page& makePage(std::uint64_t number);
    const Page* findPage(std::uint64_t number) const;
    void addToPage(std::uint64_t number, unsigned int first, std::uint64_t count, ExtentSet* repeated);
    void addWord(std::uint64_t number, Page& page, std::size_t word, Word bits, ExtentSet* repeated);
    void addPage(std::uint64_t number, const Page& page, ExtentSet* repeated);
    void makeBits(Page& page);
    void dropBits(Page& page);

    static std::uint64_t countCommon(const Page& one, const Page& other);

    template <typename Visit>
    static void visitWord(std::uint64_t start, Word bits, Visit& visit);
    template <typename Visit>
    static void visitPage(std::uint64_t number, const Page& page, unsigned int first, std::uint64_t count,
                          Visit& visit);

    ExtentMemory& memory_;
    std::vector<Page> near_;                       ///< the first pages: of 64 TiB in extents of 64 KiB, all
    std::unordered_map<std::uint64_t, Page> far_;  ///< those after them, by number
    std::uint64_t size_ = 0;
};

/// Adds extents to a set, those by themselves some at a time: where they lie at random, memory then fetches what they
/// need together, not one after the other.
class ExtentAdder {
public:
    /// `repeated` as for ExtentSet::add(); may be null.
    ExtentAdder(ExtentSet& set, ExtentSet* repeated) : set_(set), repeated_(repeated) {}

    void add(std::uint64_t first, std::uint64_t count) {
        if (count > 1) return set_.add(first, count, repeated_);
        waiting_[waits_++] = first;
        if (waits_ == waiting_.size()) finish();
    }

    /// To be called after the last one: only then all are in the set.
    void finish() { set_.add(waiting_, std::exchange(waits_, 0), repeated_); }

private:
    ExtentSet& set_;
    ExtentSet* repeated_;
    std::array<std::uint64_t, 64> waiting_ = {};
    std::size_t waits_ = 0;
};

template <std::size_t most>
void ExtentSet::add(const std::array<std::uint64_t, most>& extents, std::size_t count, ExtentSet* repeated) {
    for (std::size_t i = 0; i < count; ++i) {
        const std::uint64_t number = extents[i] / pageExtents;
        const Bits* bits = number < near_.size() ? near_[static_cast<std::size_t>(number)].bits.get() : nullptr;
        if (bits != nullptr)
            __builtin_prefetch(&(*bits)[static_cast<std::size_t>(extents[i] % pageExtents / wordBits)], 1);
    }
    for (std::size_t i = 0; i < count; ++i) {
        Page& page = pageAt(extents[i] / pageExtents);
        const auto word = static_cast<std::size_t>(extents[i] % pageExtents / wordBits);
        addWord(extents[i] / pageExtents, page, word, Word{1} << extents[i] % wordBits, repeated);
    }
}

template <typename Visit>
void ExtentSet::visitWord(std::uint64_t start, Word bits, Visit& visit) {
    for (unsigned int at = 0; bits != 0;) {
        const auto skipped = static_cast<unsigned int>(__builtin_ctzll(bits));
        bits >>= skipped;
        at += skipped;
        const unsigned int run = ~bits == 0 ? wordBits : static_cast<unsigned int>(__builtin_ctzll(~bits));
        visit(start + at, std::uint64_t{run});
        if (run == wordBits) return;
        bits >>= run;
        at += run;
    }
}

template <typename Visit>
void ExtentSet::visitPage(std::uint64_t number, const Page& page, unsigned int first, std::uint64_t count,
                          Visit& visit) {
    const std::uint64_t start = number * pageExtents;
    if (page.count == pageExtents) {
        visit(start + first, count);
        return;
    }
    for (std::uint64_t at = first; at < first + count;) {
        const auto bit = static_cast<unsigned int>(at % wordBits);
        const Word wanted = mask(bit, first + count - at);
        visitWord(start + at - bit, (*page.bits)[static_cast<std::size_t>(at / wordBits)] & wanted, visit);
        at += wordBits - bit;
    }
}

template <typename Visit>
void ExtentSet::forEachIn(std::uint64_t first, std::uint64_t count, Visit&& visit) const {
    if (count == 0) return;
    const std::uint64_t last = first + count - 1;
    const auto visitPart = [&](std::uint64_t number, const Page& page) {
        const std::uint64_t start = std::max(first, number * pageExtents);
        const std::uint64_t end = std::min(last, number * pageExtents + pageExtents - 1) + 1;
        visitPage(number, page, static_cast<unsigned int>(start % pageExtents), end - start, visit);
    };
    std::uint64_t number = first / pageExtents;
    const bool isShort = last / pageExtents - number <= far_.size();
    for (; number <= last / pageExtents && (isShort || number < near_.size()); ++number) {
        const Page* page = findPage(number);
        if (page != nullptr && page->count > 0) visitPart(number, *page);
    }
    if (isShort) return;
    std::vector<std::uint64_t> numbers;
    for (const auto& page : far_) {
        if (page.first >= number && page.first <= last / pageExtents) numbers.push_back(page.first);
    }
    std::sort(numbers.begin(), numbers.end());
    for (const std::uint64_t far : numbers) visitPart(far, far_.at(far));
}

}  // namespace inspection
