// What the command must know of terminals: whether one is there, whether it takes colour, how wide text is on it.
#pragma once

#include <string>
#include <string_view>

enum class ColorMode { automatic, always, never };

bool isTerminal(int descriptor);

/// Whether what goes to standard output is coloured: asked for, or a terminal that does not decline (NO_COLOR, "dumb").
bool usesColor(ColorMode mode);

/// Columns of the terminal behind standard error; 80 when it does not say.
int terminalColumns();

/// `text` fit for one line: control characters, on a terminal unseen ones too, as `\xNN`; what is not UTF-8 as U+FFFD.
std::string printable(std::string_view text);

/// Terminal columns that a text from `printable` takes: 2 for wide characters, 0 for combining ones.
int displayWidth(std::string_view text);
