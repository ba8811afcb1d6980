// The colors of a waveform picture: named themes, or colors from the command line.
#pragma once

#include <cstdint>
#include <optional>
#include <string>

struct Color {
    std::uint8_t red = 0, green = 0, blue = 0, alpha = 255;
    bool operator==(const Color&) const = default;
};

struct PictureColors {
    Color wave, background, axis, clipping;
};

/// `part` of `to` in `from`, 0 to 1; what is transparent adds no color of its own.
Color mixed(Color from, Color to, double part);

/// The default theme.
PictureColors defaultColors();

/// From the name of a theme, or "WAVE,BACKGROUND[,AXIS[,CLIPPING]]" of hexadecimal colors ("1F6FEB", "#1F6FEB" or
/// "#abc"); the background may be "none". Without an axis color one is chosen that shows on the background, and without
/// one of clipping one that differs from the wave. None for anything else.
std::optional<PictureColors> colorsFromText(const std::string& text);

/// The names of the themes, for messages and help.
std::string themeNames();
