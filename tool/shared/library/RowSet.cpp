#include "tool/shared/library/RowSet.h"

#include <algorithm>
#include <bit>

namespace {

constexpr std::size_t wordOf(std::int64_t row)
{
    return static_cast<std::size_t>(row >> 6 & 63);
}

constexpr std::uint64_t bitOf(std::int64_t row)
{
    return std::uint64_t{1} << (row & 63);
}

} // namespace

void RowSet::add(std::int64_t row)
{
    const std::int64_t number = row >> kBlockShift;
    Block* block = nullptr;
    if (number >= 0 && number < kNearBlocks) {
        const auto place = static_cast<std::size_t>(number);
        if (place >= near_.size())
            near_.resize(place + 1);
        if (!near_[place])
            near_[place] = std::make_unique<Block>();
        block = near_[place].get();
    } else {
        block = &far_[number];
    }
    std::uint64_t& word = (*block)[wordOf(row)];
    size_ += (word & bitOf(row)) == 0 ? 1U : 0U;
    word |= bitOf(row);
}

const RowSet::Block* RowSet::find(std::int64_t number) const
{
    if (number >= 0 && number < kNearBlocks) {
        const auto place = static_cast<std::size_t>(number);
        return place < near_.size() ? near_[place].get() : nullptr;
    }
    const auto block = far_.find(number);
    return block != far_.end() ? &block->second : nullptr;
}

std::vector<std::int64_t> RowSet::numbers() const
{
    std::vector<std::int64_t> numbers;
    for (std::size_t place = 0; place < near_.size(); ++place)
        if (near_[place])
            numbers.push_back(static_cast<std::int64_t>(place));
    for (const auto& [number, block] : far_)
        numbers.push_back(number);
    std::ranges::sort(numbers);
    return numbers;
}

bool RowSet::holds(std::int64_t row) const
{
    const Block* const block = find(row >> kBlockShift);
    return block != nullptr && ((*block)[wordOf(row)] & bitOf(row)) != 0;
}

void RowSet::keep(const RowSet& other)
{
    size_ = 0;
    for (const std::int64_t number : numbers()) {
        const Block* const theirs = other.find(number);
        Block& ours = number >= 0 && number < kNearBlocks ? *near_[static_cast<std::size_t>(number)] : far_[number];
        for (std::size_t i = 0; i < ours.size(); ++i) {
            ours[i] &= theirs != nullptr ? (*theirs)[i] : 0;
            size_ += static_cast<std::size_t>(std::popcount(ours[i]));
        }
    }
}

std::vector<std::int64_t> RowSet::rows() const
{
    std::vector<std::int64_t> result;
    result.reserve(size_);
    for (const std::int64_t number : numbers()) {
        const Block& block = *find(number);
        for (std::size_t i = 0; i < block.size(); ++i)
            for (std::uint64_t word = block[i]; word != 0; word &= word - 1)
                result.push_back((number << kBlockShift) + static_cast<std::int64_t>(i << kWordShift) +
                                 std::countr_zero(word));
    }
    return result;
}
