// Access to items outside a host's sandbox, which some systems tie to a URL.
#pragma once

#include "platform/URL.h"

namespace platform {

/// True when access was given; each such call needs one stopSecurityScopedAccess. Always false on Linux, where URLs
/// carry no access.
KT_EXPORT bool startSecurityScopedAccess(const URL& url);
/// Ends what one startSecurityScopedAccess gave; does nothing on Linux.
KT_EXPORT void stopSecurityScopedAccess(const URL& url);

} // namespace platform
