// The line of progress on standard error.
#pragma once

#include <functional>
#include <mutex>
#include <string>

/// Any thread may draw it. It never mixes with other output, because whatever writes to the terminal clears it first.
namespace progressline {

/// Draws unless it did so less than a tenth of a second ago, or was cleared for other output less than three tenths
/// ago. Calls `text` only then, with the columns available.
void draw(const std::function<std::string(int columns)>& text);

/// Clears the line and prevents drawing during the lifetime of this object.
class Cleared {
public:
    Cleared();

private:
    std::lock_guard<std::recursive_mutex> lock_;
};

/// For handlers of signals that end the process.
void clearFromSignalHandler();

} // namespace progressline
