// The one line on standard error that tells people who wait how far the work is.
#pragma once

#include <functional>
#include <mutex>
#include <string>

/// Drawn by any thread, and never mixed with other output: whatever writes to the terminal clears it first.
namespace progressline {

/// Draws, unless it did less than a tenth of a second ago, or other output was cleared for less than three. `text` is
/// asked for the line only then, with the columns that it may take.
void draw(const std::function<std::string(int columns)>& text);

/// Clears the line if there is one; for as long as this lives none is drawn.
class Cleared {
public:
    Cleared();

private:
    std::lock_guard<std::recursive_mutex> lock_;
};

/// For a handler of signals that end the process.
void clearFromSignalHandler();

} // namespace progressline
