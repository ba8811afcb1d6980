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

/// Mixes `part` of `to`, 0 to 1, into `from`; transparency adds no color.
Color mixed(Color from, Color to, double part);

/// The default theme.
PictureColors defaultColors();

/// Parses the name of a theme, or "WAVE,BACKGROUND[,AXIS[,CLIPPING]]" with hexadecimal colors ("1F6FEB", "#1F6FEB" or
/// "#abc"); the background may be "none". A missing axis color is chosen to contrast with the background, a missing
/// clipping color to differ from the wave. None for any other text.
std::optional<PictureColors> colorsFromText(const std::string& text);

/// Theme names for messages and help.
std::string themeNames();
