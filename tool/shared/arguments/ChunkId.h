// Chunk ids as people write them: the form in which the command prints them, and shorter.
#pragma once

#include "platform/core/FourCC.h"

#include <optional>
#include <string_view>

/// One to four characters of printable ASCII, or `\xNN` for any byte; padded with spaces to four, so that "fmt" is
/// "fmt ". None for anything else. Reads back what fourCCText writes.
std::optional<FourCC> chunkIdFromText(std::string_view text);
