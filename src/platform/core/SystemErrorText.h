// System error numbers in words.
#pragma once

#include "platform/core/Export.h"

#include <string>

/// A short text for a system error number: that of its status (Status.h), or the system's own where the status says too
/// little.
KT_EXPORT std::string SystemErrorText(int systemError);
