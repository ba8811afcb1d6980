// Finds the paths of coordinated items, which have only numbers.
#pragma once

#include "platform/FileCoordination.h"

#include <cstdint>
#include <map>
#include <string>
#include <vector>

/// The paths of those items that one of the parties' processes has open, the only place where a path can be found and
/// checked against the number. Other items are missing.
std::map<std::uint64_t, std::string> itemNames(const std::vector<platform::CoordinationParty>& parties);
