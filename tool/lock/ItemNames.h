// The paths behind the numbers of coordinated items.
#pragma once

#include "platform/FileCoordination.h"

#include <cstdint>
#include <map>
#include <string>
#include <vector>

/// The paths of those items that a process among the parties has open: the only place where a path can be found, and
/// be held against the number. The others are missing.
std::map<std::uint64_t, std::string> itemNames(const std::vector<platform::CoordinationParty>& parties);
