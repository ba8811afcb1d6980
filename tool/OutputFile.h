// Results that the command writes to a file of the user's choice.
#pragma once

#include <functional>
#include <string>
#include <string_view>

/// Takes bytes; throws Failure when they cannot be written.
using Sink = std::function<void(std::string_view)>;

/// Writes what `produce` hands to the sink to `out`, which must not be the file `source`. A regular file takes its name
/// when it is whole, in the place of what has it; a device or a FIFO is written as it is. Throws Failure.
void writeOutputFile(const std::string& out, const std::string& source,
                     const std::function<void(const Sink&)>& produce);
