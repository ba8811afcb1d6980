// How a call of the C interface ends: with a status, and in words for ktf_last_error(). No exception leaves it.
#pragma once

#include "c/ktfiles.h"
#include "platform/URL.h"
#include "platform/core/Error.h"

#include <algorithm>
#include <cstddef>
#include <cstring>
#include <cxxabi.h>
#include <string_view>

/// Keeps "NAME: WHY" for ktf_last_error() on this thread, and returns the status. Null names are left out; without a
/// reason the status's own text is taken.
ktf_status failCall(const char* name, ktf_status status, std::string_view why = {});
/// The same for the exception that is being handled.
ktf_status failCallByException(const char* name);
/// The same for an error of the object layer.
ktf_status failCallByError(const char* name, const platform::Error& error);
/// The same for null where there must be something.
ktf_status failCallByNull(const char* name);

/// Runs a call's work, which returns a status that it has told of. A thread that is cancelled goes on to its end.
template <class Work>
ktf_status guardedCall(const char* name, Work work)
{
    try {
        return work();
    } catch (const abi::__forced_unwind&) {
        throw;
    } catch (...) {
        return failCallByException(name);
    }
}

/// Gives a struct to a caller who was compiled with one of `size` bytes, which may be shorter or longer than ours.
template <class Struct>
void giveStruct(Struct* to, std::size_t size, const Struct& value)
{
    std::memset(to, 0, size);
    std::memcpy(to, &value, std::min(size, sizeof value));
}

/// Where a path leads, relative to the working folder; null for the empty path, and where that folder is gone.
platform::URLRef locationOfPath(const char* path);
