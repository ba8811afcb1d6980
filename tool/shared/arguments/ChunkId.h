// Parses chunk ids as the command prints them, and shorter forms.
#pragma once

#include "platform/core/FourCC.h"

#include <optional>
#include <string_view>

/// One to four characters of printable ASCII, or `\xNN` for any byte; padded with spaces to four, so "fmt" is "fmt ".
/// None for anything else. Accepts everything that fourCCText writes.
std::optional<FourCC> chunkIdFromText(std::string_view text);
