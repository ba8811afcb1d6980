// What the command must know of terminals: whether one is there, whether it takes colour, how wide text is on it.
#pragma once

#include <optional>
#include <string>
#include <string_view>

enum class ColorMode { automatic, always, never };

bool isTerminal(int descriptor);

/// Whether what goes to standard output is coloured: asked for, or a terminal that does not decline (NO_COLOR, "dumb").
bool usesColor(ColorMode mode);

/// Columns of the terminal, as COLUMNS says, or else the terminal itself; 80 when neither does.
int terminalColumns();

/// The same where standard output is a terminal. None where it is not: nothing has to fit there, so nothing is cut.
std::optional<int> columnsOfOutput();

/// `text` fit for one line: control characters, on a terminal unseen ones too, as `\xNN`; what is not UTF-8 as U+FFFD.
std::string printable(std::string_view text);
