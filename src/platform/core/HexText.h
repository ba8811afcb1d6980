// Bytes in hexadecimal.
#pragma once

#include "platform/core/Bytes.h"
#include "platform/core/Export.h"

#include <string>

/// Two lower-case digits per byte.
KT_EXPORT std::string hexText(BytesView bytes);
