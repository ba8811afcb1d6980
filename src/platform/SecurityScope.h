// Access to items outside a host's sandbox, which a system may tie to a URL.
#pragma once

#include "platform/URL.h"

namespace platform {

/// True when access was given, and so has to be stopped as often. On Linux URLs carry no access: always false.
KT_EXPORT bool startSecurityScopedAccess(const URL& url);
KT_EXPORT void stopSecurityScopedAccess(const URL& url);

} // namespace platform
