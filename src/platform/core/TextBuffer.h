// Text that grows as it is made, and where it goes when there is much of it.
#pragma once

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <memory>
#include <string_view>

/// Bytes with room behind them, which is not filled with anything.
class TextBuffer {
public:
    std::size_t size() const { return size_; }
    /// All of them, until the buffer changes.
    std::string_view view() const { return {bytes_.get(), size_}; }
    /// Keeps the room.
    void clear() { size_ = 0; }
    /// A copy of the text.
    void append(std::string_view text)
    {
        text.copy(room(text.size()), text.size());
        advance(text.size());
    }

    /// Where the next `size` bytes go, until the buffer changes.
    char* room(std::size_t size)
    {
        if (size >= capacity_ - size_) // never null
            grow(size);
        return bytes_.get() + size_;
    }
    /// They are there.
    void advance(std::size_t size) { size_ += size; }

private:
    void grow(std::size_t size)
    {
        constexpr std::size_t least = 512;
        const std::size_t capacity = std::max({least, 2 * capacity_, size_ + size});
        auto bytes = std::make_unique_for_overwrite<char[]>(capacity);
        if (size_ > 0)
            std::memcpy(bytes.get(), bytes_.get(), size_);
        bytes_ = std::move(bytes);
        capacity_ = capacity;
    }

    std::unique_ptr<char[]> bytes_;
    std::size_t size_ = 0, capacity_ = 0;
};

/// Takes text in large pieces. Who makes it puts it into the buffer, and flushes ahead of more than kFlushSize bytes.
class TextOutput {
public:
    /// How much the buffer may hold.
    static constexpr std::size_t kFlushSize = std::size_t{64} * 1024;

    virtual ~TextOutput() = default;
    /// What is not written yet.
    TextBuffer& buffer() { return buffer_; }
    /// Empties the buffer; false when anything could not be written.
    virtual bool flush() = 0;
    /// Behind what is in the buffer.
    virtual void write(std::string_view bytes) = 0;

private:
    TextBuffer buffer_;
};
