// A file descriptor that closes itself.
#pragma once

#include "platform/core/Export.h"

#include <string>
#include <utility>

namespace platform {

/// Takes the descriptor; closed with its owner, through platform/SystemCalls.h.
class KT_EXPORT OwnedDescriptor {
public:
    OwnedDescriptor() = default;
    explicit OwnedDescriptor(int number) : number_(number) {}
    OwnedDescriptor(OwnedDescriptor&& other) noexcept : number_(std::exchange(other.number_, -1)) {}
    OwnedDescriptor& operator=(OwnedDescriptor&& other) noexcept
    {
        std::swap(number_, other.number_);
        return *this;
    }
    ~OwnedDescriptor();

    int get() const { return number_; }
    explicit operator bool() const { return number_ >= 0; }

private:
    int number_ = -1;
};

/// A path that leads to the open file itself in this process: what has its name meanwhile, or stands on the way to it,
/// does not matter.
KT_EXPORT std::string pathOfDescriptor(int descriptor);

} // namespace platform
