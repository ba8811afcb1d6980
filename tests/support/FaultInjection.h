// Faults at the system-call seam: a test replaces entries of the call table, which are restored when it ends.
#pragma once

#include "platform/SystemCalls.h"

#include <algorithm>
#include <array>
#include <cerrno>
#include <cstdint>
#include <limits>

#include <signal.h>
#include <unistd.h>

/// Restores the call table at the end of the scope; `platform::systemCalls()` may be changed freely meanwhile.
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

enum class Call {
    openFile,
    openFileWithoutLinks,
    createFile,
    close,
    pread,
    pwrite,
    ftruncate,
    fsync,
    preallocate,
    syncFolder,
    renameWithoutReplacing,
    exchangeNames,
    removeFile,
    linkFile,
    openFolder,
    createFileIn,
    renameIn,
    renameInWithoutReplacing,
    shareContent,
    copyRange,
    setOwner,
    count
};

/// Counts calls of the table and makes some fail, until the end of the scope. Only one at a time.
class FaultInjector {
public:
    FaultInjector()
    {
        using platform::SystemCalls;
        current_ = this;
        SystemCalls& calls = platform::systemCalls();
        calls.openFile = intercept<Call::openFile, &SystemCalls::openFile>;
        calls.openFileWithoutLinks = intercept<Call::openFileWithoutLinks, &SystemCalls::openFileWithoutLinks>;
        calls.createFile = intercept<Call::createFile, &SystemCalls::createFile>;
        calls.ftruncate = intercept<Call::ftruncate, &SystemCalls::ftruncate>;
        calls.fsync = intercept<Call::fsync, &SystemCalls::fsync>;
        calls.preallocate = intercept<Call::preallocate, &SystemCalls::preallocate>;
        calls.syncFolder = intercept<Call::syncFolder, &SystemCalls::syncFolder>;
        calls.renameWithoutReplacing = intercept<Call::renameWithoutReplacing, &SystemCalls::renameWithoutReplacing>;
        calls.exchangeNames = intercept<Call::exchangeNames, &SystemCalls::exchangeNames>;
        calls.removeFile = intercept<Call::removeFile, &SystemCalls::removeFile>;
        calls.linkFile = intercept<Call::linkFile, &SystemCalls::linkFile>;
        calls.openFolder = intercept<Call::openFolder, &SystemCalls::openFolder>;
        calls.createFileIn = intercept<Call::createFileIn, &SystemCalls::createFileIn>;
        calls.renameIn = intercept<Call::renameIn, &SystemCalls::renameIn>;
        calls.renameInWithoutReplacing =
            intercept<Call::renameInWithoutReplacing, &SystemCalls::renameInWithoutReplacing>;
        calls.shareContent = intercept<Call::shareContent, &SystemCalls::shareContent>;
        calls.copyRange = intercept<Call::copyRange, &SystemCalls::copyRange>;
        calls.setOwner = intercept<Call::setOwner, &SystemCalls::setOwner>;
        calls.pread = transfer<Call::pread, &SystemCalls::pread>;
        calls.pwrite = transfer<Call::pwrite, &SystemCalls::pwrite>;
        // Like the system's, a close that fails has closed.
        calls.close = [](int descriptor) {
            const int result = real().close(descriptor);
            return hit(Call::close) ? failed() : result;
        };
    }
    ~FaultInjector() { current_ = nullptr; }

    /// The `nth` call from now on (1 is the next), and the `times - 1` after it, fail with `error`; an error of 0 makes
    /// a transfer return 0. Each call has one such plan at a time.
    void fail(Call call, int error, int nth = 1, int times = 1)
    {
        Plan& plan = of(call);
        plan = {plan.calls + nth, plan.calls + nth + times, error, plan.calls};
    }
    /// Kills the process before its `nth` call that changes something (1 is the next).
    void killAt(int nth) { changesUntilKilled_ = nth; }
    /// Limits every transfer to `bytes` bytes.
    void limitTransfers(std::size_t bytes) { limit_ = bytes; }
    /// Calls since construction, including failed ones.
    int calls(Call call) { return of(call).calls; }

private:
    struct Plan {
        int first = 0, end = 0, error = 0, calls = 0;
    };
    Plan& of(Call call) { return plans_[static_cast<std::size_t>(call)]; }
    static const platform::SystemCalls& real() { return current_->guard_.real(); }
    static int failed() { return errno == 0 ? 0 : -1; }
    static bool hit(Call call)
    {
        const bool changes = call == Call::createFile || call == Call::pwrite || call == Call::removeFile ||
                             call == Call::renameWithoutReplacing || call == Call::exchangeNames;
        if (changes && current_->changesUntilKilled_ > 0 && --current_->changesUntilKilled_ == 0)
            ::kill(::getpid(), SIGKILL);
        Plan& plan = current_->of(call);
        ++plan.calls;
        if (plan.calls < plan.first || plan.calls >= plan.end)
            return false;
        errno = plan.error;
        return true;
    }
    template <Call call, auto entry, class Result, class... Arguments>
    static Result intercept(Arguments... arguments)
    {
        return hit(call) ? failed() : (real().*entry)(arguments...);
    }
    template <Call call, auto entry, class Buffer>
    static std::int64_t transfer(int descriptor, Buffer buffer, std::size_t count, std::int64_t offset)
    {
        return hit(call) ? failed() : (real().*entry)(descriptor, buffer, std::min(count, current_->limit_), offset);
    }

    inline static FaultInjector* current_ = nullptr;
    SystemCallGuard guard_;
    std::array<Plan, static_cast<std::size_t>(Call::count)> plans_;
    int changesUntilKilled_ = 0;
    std::size_t limit_ = std::numeric_limits<std::size_t>::max();
};
