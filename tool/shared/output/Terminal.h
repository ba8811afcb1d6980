// Properties of the terminal: whether there is one, whether it has colour, how wide it is.
#pragma once

#include <optional>
#include <string>
#include <string_view>

enum class ColorMode { automatic, always, never };

bool isTerminal(int descriptor);

/// Whether standard output is coloured: if requested, or on a terminal that does not decline (NO_COLOR, "dumb").
bool usesColor(ColorMode mode);

/// Terminal columns according to COLUMNS, or else to the terminal itself; 80 if neither says.
int terminalColumns();

/// As above if standard output is a terminal. None otherwise: then nothing needs to fit, so nothing is cut.
std::optional<int> columnsOfOutput();

/// `text` made fit for one line: control characters, and on a terminal invisible ones, as `\xNN`; invalid UTF-8 as
/// U+FFFD.
std::string printable(std::string_view text);
