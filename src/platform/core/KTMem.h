// The memory block of the suite: bytes and their size, shared through std::shared_ptr where several owners need it.
#pragma once

#include "platform/core/Export.h"

#include <cstddef>

/// Owns its bytes; movable, not copyable. Growing keeps the content and fills the new part with zeros. Appending in
/// small steps costs amortised constant time.
class KT_EXPORT KTMem {
public:
    KTMem() = default;
    /// `size` zero bytes. Throws std::bad_alloc.
    explicit KTMem(std::size_t size);
    KTMem(KTMem&& other) noexcept;
    KTMem& operator=(KTMem&& other) noexcept;
    ~KTMem();

    /// Replaces the content with `size` zero bytes. False, and the block unchanged, when memory is short.
    bool allocate(std::size_t size);
    /// Changes the size, and keeps the first min(old, new) bytes. False, and the block unchanged, when memory is
    /// short.
    bool reallocate(std::size_t size);
    /// Gives the memory back; the size is 0 then.
    void free();

    /// Each the first byte, null while the block is empty; valid until the size changes.
    std::byte* data() { return data_; }
    const std::byte* data() const { return data_; }
    /// In bytes.
    std::size_t size() const { return size_; }

private:
    std::byte* data_ = nullptr;
    std::size_t size_ = 0;
    std::size_t capacity_ = 0;
};
