#include "store/ExtentSet.h"

#include <unistd.h>

#include <new>

namespace inspection {

namespace {

/// About what a far page takes beside its bits: itself, its number, and the table's and the allocator's own.
constexpr std::uint64_t farOverhead = 64;

std::uint64_t usualLimit() {
    constexpr std::uint64_t most = std::uint64_t{1} << 30U;
    const auto pages = sysconf(_SC_PHYS_PAGES);
    const auto pageSize = sysconf(_SC_PAGESIZE);
    if (pages <= 0 || pageSize <= 0) return most;
    return std::min(most, static_cast<std::uint64_t>(pages) * static_cast<std::uint64_t>(pageSize) / 4);
}

}  // namespace

ExtentMemory::ExtentMemory() : ExtentMemory(usualLimit()) {}

void ExtentMemory::take(std::uint64_t bytes) {
    if (bytes > left_) throw std::bad_alloc();
    left_ -= bytes;
}

const ExtentSet::Page* ExtentSet::findPage(std::uint64_t number) const {
    if (number < near_.size()) return &near_[static_cast<std::size_t>(number)];
    const auto page = far_.find(number);
    return page != far_.end() ? &page->second : nullptr;
}

ExtentSet::Page& ExtentSet::makePage(std::uint64_t number) {
    if (number < mostNear) {
        const std::uint64_t size = std::min(mostNear, std::max<std::uint64_t>(number + 1, 2 * near_.size()));
        memory_.take((size - near_.size()) * sizeof(Page));
        near_.resize(static_cast<std::size_t>(size));
        return near_[static_cast<std::size_t>(number)];
    }
    const auto found = far_.find(number);
    if (found != far_.end()) return found->second;
    memory_.take(farOverhead);
    return far_[number];
}

void ExtentSet::makeBits(Page& page) {
    memory_.take(sizeof(Bits));
    page.bits = std::make_unique<Bits>();
}

void ExtentSet::dropBits(Page& page) {
    if (page.bits != nullptr) memory_.give(sizeof(Bits));
    page.bits.reset();
}

void ExtentSet::addWord(std::uint64_t number, Page& page, std::size_t word, Word bits, ExtentSet* repeated) {
    const bool full = page.count == pageExtents;
    const Word before = full ? bits : page.bits != nullptr ? (*page.bits)[word] & bits : 0;
    if (repeated != nullptr && before != 0) repeated->addWord(number, repeated->pageAt(number), word, before, nullptr);
    if (before == bits) return;
    if (page.bits == nullptr) makeBits(page);
    (*page.bits)[word] |= bits;
    const bool isOne = (bits & (bits - 1)) == 0;
    const std::uint32_t added = isOne ? 1 : static_cast<std::uint32_t>(__builtin_popcountll(bits & ~before));
    size_ += added;
    page.count += added;
    if (page.count == pageExtents) dropBits(page);
}

void ExtentSet::addToPage(std::uint64_t number, unsigned int first, std::uint64_t count, ExtentSet* repeated) {
    Page& page = pageAt(number);
    if (count == pageExtents && page.count == 0) {
        page.count = pageExtents;
        size_ += pageExtents;
        return;
    }
    if (count == pageExtents && page.count == pageExtents) {
        if (repeated != nullptr) repeated->addToPage(number, first, count, nullptr);
        return;
    }
    for (std::uint64_t at = first; at < first + count;) {
        const auto bit = static_cast<unsigned int>(at % wordBits);
        addWord(number, page, static_cast<std::size_t>(at / wordBits), mask(bit, first + count - at), repeated);
        at += wordBits - bit;
    }
}

void ExtentSet::add(std::uint64_t first, std::uint64_t count, ExtentSet* repeated) {
    while (count > 0) {
        const auto inPage = static_cast<unsigned int>(first % pageExtents);
        const std::uint64_t part = std::min(count, pageExtents - inPage);
        addToPage(first / pageExtents, inPage, part, repeated);
        first += part;
        count -= part;
    }
}

void ExtentSet::add(const ExtentSet& other, ExtentSet* repeated) {
    for (std::size_t number = 0; number < other.near_.size(); ++number) addPage(number, other.near_[number], repeated);
    for (const auto& [number, page] : other.far_) addPage(number, page, repeated);
}

void ExtentSet::addPage(std::uint64_t number, const Page& page, ExtentSet* repeated) {
    if (page.count == pageExtents) addToPage(number, 0, pageExtents, repeated);
    for (std::size_t word = 0; page.bits != nullptr && word < page.bits->size(); ++word) {
        const Word bits = (*page.bits)[word];
        if (bits != 0) addWord(number, pageAt(number), word, bits, repeated);
    }
}

std::uint64_t ExtentSet::countCommon(const Page& one, const Page& other) {
    if (one.count == pageExtents) return other.count;
    if (other.count == pageExtents) return one.count;
    std::uint64_t count = 0;
    if (one.bits == nullptr || other.bits == nullptr) return count;
    for (std::size_t word = 0; word < one.bits->size(); ++word) {
        count += static_cast<std::uint64_t>(__builtin_popcountll((*one.bits)[word] & (*other.bits)[word]));
    }
    return count;
}

std::uint64_t ExtentSet::countCommon(const ExtentSet& other) const {
    std::uint64_t count = 0;
    const std::size_t both = std::min(near_.size(), other.near_.size());
    for (std::size_t number = 0; number < both; ++number) count += countCommon(near_[number], other.near_[number]);
    for (const auto& [number, page] : other.far_) {
        const auto own = far_.find(number);
        if (own != far_.end()) count += countCommon(own->second, page);
    }
    return count;
}

void ExtentSet::clear() {
    for (Page& page : near_) dropBits(page);
    for (auto& [number, page] : far_) dropBits(page);
    memory_.give(near_.size() * sizeof(Page) + far_.size() * farOverhead);
    std::vector<Page>().swap(near_);
    far_.clear();
    size_ = 0;
}

}  // namespace inspection
