// A file descriptor that closes itself.
#pragma once

#include "platform/core/Export.h"

#include <string>
#include <utility>

namespace platform {

/// Owns a descriptor and closes it, through platform/SystemCalls.h.
class KT_EXPORT OwnedDescriptor {
public:
    OwnedDescriptor() = default;
    /// Takes the descriptor over; -1 is none.
    explicit OwnedDescriptor(int number) : number_(number) {}
    /// Takes the descriptor over and leaves none behind.
    OwnedDescriptor(OwnedDescriptor&& other) noexcept : number_(std::exchange(other.number_, -1)) {}
    OwnedDescriptor& operator=(OwnedDescriptor&& other) noexcept
    {
        std::swap(number_, other.number_);
        return *this;
    }
    ~OwnedDescriptor();

    /// The descriptor, still owned here; -1 for none.
    int get() const { return number_; }
    /// Whether there is a descriptor.
    explicit operator bool() const { return number_ >= 0; }

private:
    int number_ = -1;
};

/// A path that leads to the open file itself in this process, even when another file has its name or its folders have
/// moved.
KT_EXPORT std::string pathOfDescriptor(int descriptor);

} // namespace platform
