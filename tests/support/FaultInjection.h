// Faults at the system-call seam: a test replaces entries of the call table and has them back when it ends.
#pragma once

#include "platform/SystemCalls.h"

/// Restores the call table when it goes out of scope: assign to `platform::systemCalls()` freely meanwhile.
class SystemCallGuard {
public:
    SystemCallGuard() : saved_(platform::systemCalls()) {}
    ~SystemCallGuard() { platform::systemCalls() = saved_; }
    SystemCallGuard(const SystemCallGuard&) = delete;
    SystemCallGuard& operator=(const SystemCallGuard&) = delete;
    const platform::SystemCalls& real() const { return saved_; }

private:
    platform::SystemCalls saved_;
};
