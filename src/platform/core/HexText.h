// Bytes as people compare them.
#pragma once

#include "platform/core/Bytes.h"

#include <string>

/// Two small digits for each.
std::string hexText(BytesView bytes);
