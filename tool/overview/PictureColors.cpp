#include "tool/overview/PictureColors.h"

#include <algorithm>
#include <array>
#include <charconv>
#include <cmath>
#include <string_view>
#include <vector>

namespace {

struct Theme {
    std::string_view name;
    PictureColors colors;
};

constexpr Color rgb(std::uint32_t value)
{
    return {static_cast<std::uint8_t>(value >> 16), static_cast<std::uint8_t>(value >> 8),
            static_cast<std::uint8_t>(value), 255};
}

constexpr Color kNoColor{0, 0, 0, 0};

constexpr std::array kThemes{
    Theme{"night", {rgb(0x5CD6C0), rgb(0x12161C), rgb(0x93A1B3), rgb(0xFF5A52)}},
    Theme{"day", {rgb(0x2457C5), rgb(0xFBFBF9), rgb(0x5E6673), rgb(0xD92626)}},
    Theme{"amber", {rgb(0xFFB347), rgb(0x1A1512), rgb(0xAE9B86), rgb(0xFF4B3E)}},
    Theme{"rose", {rgb(0xD6336C), rgb(0xFFF8F9), rgb(0x7C626B), rgb(0x3B2FB0)}},
    Theme{"ink", {rgb(0x16181D), rgb(0xFFFFFF), rgb(0x5A5E66), rgb(0xE00000)}},
};

std::optional<Color> colorFromText(std::string_view text)
{
    if (text.starts_with('#'))
        text.remove_prefix(1);
    std::uint32_t value = 0;
    const auto [end, error] = std::from_chars(text.data(), text.data() + text.size(), value, 16);
    if (error != std::errc() || end != text.data() + text.size() || (text.size() != 3 && text.size() != 6))
        return std::nullopt;
    if (text.size() == 3)
        value = ((value & 0xF00) << 8 | (value & 0x0F0) << 4 | (value & 0x00F)) * 0x11;
    return rgb(value);
}

Color axisOn(Color background)
{
    if (background.alpha == 0)
        return rgb(0x808080);
    const int luminance = (299 * background.red + 587 * background.green + 114 * background.blue) / 1000;
    return mixed(background, luminance < 128 ? rgb(0xFFFFFF) : rgb(0x000000), 0.6);
}

Color clippingBeside(Color wave)
{
    const bool isRed = wave.red > 160 && wave.green < 120 && wave.blue < 140;
    return isRed ? rgb(0x3B6FE0) : rgb(0xE8352B);
}

} // namespace

Color mixed(Color from, Color to, double part)
{
    const double alpha = from.alpha + (to.alpha - from.alpha) * part;
    const auto channel = [&](std::uint8_t a, std::uint8_t b) {
        const double value = alpha > 0 ? (a * from.alpha * (1 - part) + b * to.alpha * part) / alpha : 0;
        return static_cast<std::uint8_t>(std::lround(value));
    };
    return {channel(from.red, to.red), channel(from.green, to.green), channel(from.blue, to.blue),
            static_cast<std::uint8_t>(std::lround(alpha))};
}

PictureColors defaultColors()
{
    return kThemes.front().colors;
}

std::optional<PictureColors> colorsFromText(const std::string& text)
{
    for (const Theme& theme : kThemes)
        if (theme.name == text)
            return theme.colors;
    std::vector<std::string_view> parts;
    for (std::string_view rest = text;;) {
        const std::size_t comma = rest.find(',');
        parts.push_back(rest.substr(0, comma));
        if (comma == std::string_view::npos)
            break;
        rest.remove_prefix(comma + 1);
    }
    if (parts.size() < 2 || parts.size() > 4)
        return std::nullopt;
    const auto wave = colorFromText(parts[0]);
    const auto background = parts[1] == "none" ? std::optional(kNoColor) : colorFromText(parts[1]);
    if (!wave || !background)
        return std::nullopt;
    const auto axis = parts.size() > 2 ? colorFromText(parts[2]) : std::optional(axisOn(*background));
    const auto clipping = parts.size() > 3 ? colorFromText(parts[3]) : std::optional(clippingBeside(*wave));
    return axis && clipping ? std::optional(PictureColors{*wave, *background, *axis, *clipping}) : std::nullopt;
}

std::string themeNames()
{
    std::string names;
    for (const Theme& theme : kThemes)
        names += (names.empty() ? "" : ", ") + std::string(theme.name);
    return names;
}
