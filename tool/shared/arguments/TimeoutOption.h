// The option --timeout, as every verb that waits for others has it.
#pragma once

#include "tool/shared/arguments/Verb.h"

#include <optional>
#include <string>

/// Seconds, 0 to three years; anything else, "nan" and "inf" too, is a mistake on the command line.
void addTimeout(Verb& verb, std::optional<double>& seconds,
                const std::string& description = "Give up when others are in the way for that long: exit status 1");
