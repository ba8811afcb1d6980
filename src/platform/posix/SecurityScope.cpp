#include "platform/SecurityScope.h"

namespace platform {

bool startSecurityScopedAccess(const URL&)
{
    return false;
}

void stopSecurityScopedAccess(const URL&)
{
}

} // namespace platform
