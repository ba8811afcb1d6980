// A set of rows.
#pragma once

#include <array>
#include <cstddef>
#include <cstdint>
#include <memory>
#include <unordered_map>
#include <vector>

/// Takes an eighth of a byte for each row where rows lie close together, and never more than half a kilobyte for one.
class RowSet {
public:
    void add(std::int64_t row);
    bool holds(std::int64_t row) const;
    std::size_t size() const { return size_; }
    /// Removes the rows that the other set lacks.
    void keep(const RowSet& other);
    /// In ascending order.
    std::vector<std::int64_t> rows() const;

private:
    static constexpr int kBlockShift = 12, kWordShift = 6;
    using Block = std::array<std::uint64_t, std::size_t{1} << (kBlockShift - kWordShift)>;

    static constexpr std::int64_t kNearBlocks = 1 << 18;
    const Block* find(std::int64_t number) const;
    std::vector<std::int64_t> numbers() const;

    std::vector<std::unique_ptr<Block>> near_; // by their numbers; of a thousand million rows
    std::unordered_map<std::int64_t, Block> far_;
    std::size_t size_ = 0;
};
