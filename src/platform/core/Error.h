// The error object of the object layer, and of the platform services.
#pragma once

#include "platform/core/Value.h"

#include <cstdint>
#include <memory>
#include <string>

namespace platform {

namespace ErrorDomain {
inline constexpr const char* application = "application"; // general; the cause is the underlying error
inline constexpr const char* status = "status";           // the code is a status code (core/Status.h)
inline constexpr const char* system = "system";           // the code is a system error number
} // namespace ErrorDomain

/// What went wrong: a domain, a code in it, a text for people, and the error below, if any.
struct Error {
    std::string domain;                      // one of ErrorDomain, or a domain of the room that fails
    std::int64_t code = 0;                   // its meaning depends on the domain
    std::string description;                 // a sentence for people, in English
    std::shared_ptr<const Error> underlying; // the cause; null when none is known
    Dictionary userInfo;                     // details, by keys that the function documents
};

/// Fills `*error` unless the caller passed null. Always false, for `return fail(error, …)`.
inline bool fail(Error* error, const char* domain, std::int64_t code, std::string description)
{
    if (error != nullptr)
        *error = Error{domain, code, std::move(description), nullptr, {}};
    return false;
}

} // namespace platform
