// Descriptors that belong to this process alone, and state that a forked child must not take over.
//
// A lock of an open file description lives until the last copy of its descriptor is gone. Every descriptor of the
// coordination service is therefore opened to close on exec, and what it names is let go of in a forked child at once:
// the child may outlive its parent, whose locks must end with the parent.
#pragma once

#include <atomic>
#include <functional>
#include <utility>

namespace platform {

class Descriptor {
public:
    Descriptor() = default;
    /// Takes what `open` returns, which must close on exec; no fork happens meanwhile, so `open` must not wait.
    /// Without a descriptor errno says why, and the object is false.
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

/// Registers a word of memory that a forked child sets to null; at most eight, all of static lifetime.
void forgetInForkedChild(std::atomic<void*>& pointer);

/// One object per process, made on first use and never destroyed: threads may still use it while the process exits. A
/// forked child makes its own; the parent's is left behind as it is, locked mutexes included.
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
