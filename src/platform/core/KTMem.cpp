#include "platform/core/KTMem.h"

#include <algorithm>
#include <cstdlib>
#include <cstring>
#include <new>
#include <utility>

KTMem::KTMem(std::size_t size)
{
    if (!allocate(size))
        throw std::bad_alloc();
}

KTMem::KTMem(KTMem&& other) noexcept
    : data_(std::exchange(other.data_, nullptr)),
      size_(std::exchange(other.size_, 0)),
      capacity_(std::exchange(other.capacity_, 0))
{
}

KTMem& KTMem::operator=(KTMem&& other) noexcept
{
    std::swap(data_, other.data_);
    std::swap(size_, other.size_);
    std::swap(capacity_, other.capacity_);
    return *this;
}

KTMem::~KTMem()
{
    free();
}

bool KTMem::allocate(std::size_t size)
{
    // calloc leaves untouched pages to the system, so a large block costs nothing until it is used.
    std::byte* fresh = nullptr;
    if (size > 0) {
        fresh = static_cast<std::byte*>(std::calloc(size, 1));
        if (fresh == nullptr)
            return false;
    }
    std::free(data_);
    data_ = fresh;
    size_ = capacity_ = size;
    return true;
}

bool KTMem::reallocate(std::size_t size)
{
    if (size == 0) {
        free();
        return true;
    }
    // Grows by half; takes the exact size if that much cannot be had, and when shrinking by half.
    if (size > capacity_ || size < capacity_ / 2) {
        std::size_t capacity = size > size_ ? std::max(size, capacity_ + capacity_ / 2) : size;
        void* moved = std::realloc(data_, capacity);
        if (moved == nullptr && capacity > size)
            moved = std::realloc(data_, capacity = size);
        if (moved == nullptr)
            return false;
        data_ = static_cast<std::byte*>(moved);
        capacity_ = capacity;
    }
    if (size > size_)
        std::memset(data_ + size_, 0, size - size_);
    size_ = size;
    return true;
}

void KTMem::free()
{
    std::free(data_);
    data_ = nullptr;
    size_ = capacity_ = 0;
}
