// Descriptors that belong to this process alone, and state that a forked child must not take over.
//
// A lock of an open file description lives until the last copy of its descriptor is closed. Therefore every descriptor
// of the coordination service closes on exec, and a forked child drops its copies at once: it may outlive its parent,
// whose locks must end with the parent.
#pragma once

#include <atomic>
#include <functional>
#include <utility>

namespace platform {

class Descriptor {
public:
    Descriptor() = default;
    /// Takes the descriptor that `open` returns, which closes on exec. Forks wait meanwhile, so `open` must not block.
    /// Without a descriptor the object is false and errno says why.
    explicit Descriptor(const std::function<int()>& open);
    Descriptor(Descriptor&& other) noexcept : number_(std::exchange(other.number_, -1)) {}
    Descriptor& operator=(Descriptor&& other) noexcept
    {
        std::swap(number_, other.number_);
        return *this;
    }
    ~Descriptor();

    int get() const { return number_; }
    explicit operator bool() const { return number_ >= 0; }

private:
    int number_ = -1;
};

/// Registers a pointer that is set to null in a forked child; at most eight, all of static lifetime.
void forgetInForkedChild(std::atomic<void*>& pointer);

/// One object per process, made on first use and never destroyed, because threads may use it while the process exits. A
/// forked child makes its own and leaves the parent's as it is, locked mutexes included.
template <class T>
class PerProcess {
public:
    PerProcess() { forgetInForkedChild(pointer_); }

    T& get()
    {
        void* found = pointer_.load(std::memory_order_acquire);
        if (found == nullptr) {
            T* made = new T;
            if (pointer_.compare_exchange_strong(found, made, std::memory_order_acq_rel))
                return *made;
            delete made;
        }
        return *static_cast<T*>(found);
    }

private:
    std::atomic<void*> pointer_ = nullptr;
};

} // namespace platform
