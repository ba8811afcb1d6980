// Characters that disguise a text, or that a terminal takes for a command. Names and tags come from strangers.
#pragma once

#include "platform/core/UTF8.h"

#include <string>
#include <string_view>

using platform::isLateControl;
using platform::isUnseen;

/// Whether the text contains such a character or a C1 control. Ignores bytes that are not UTF-8.
bool isMisleading(std::string_view text);

/// As `printable` for standard error: escapes depend on whether that is a terminal, not standard output.
std::string printableOnError(std::string_view text);
