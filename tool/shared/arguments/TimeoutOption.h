// The option --timeout of verbs that wait for others.
#pragma once

#include "tool/shared/arguments/Verb.h"

#include <optional>
#include <string>

/// Seconds from 0 to three years; anything else, including "nan" and "inf", is a usage error.
void addTimeout(Verb& verb, std::optional<double>& seconds,
                const std::string& description = "Give up when others are in the way for that long: exit status 1");
