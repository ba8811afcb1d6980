// Values as texts, of numbers the shortest that stands for them alone, whatever the locale.
#pragma once

#include "platform/core/Value.h"

#include <array>
#include <charconv>
#include <concepts>
#include <string>

template <class Number>
    requires std::integral<Number> || std::floating_point<Number> std::string numberText(Number number)
    {
        std::array<char, 32> text;
        return {text.data(), std::to_chars(text.data(), text.data() + text.size(), number).ptr};
    }

/// Of a text, a number and a flag; of others none.
inline std::string valueText(const platform::Value& value)
{
    if (const auto* const text = value.get<std::string>())
        return *text;
    if (const auto* const number = value.get<std::int64_t>())
        return numberText(*number);
    if (const auto* const number = value.get<double>())
        return numberText(*number);
    const auto* const flag = value.get<bool>();
    return flag == nullptr ? "" : *flag ? "true" : "false";
}
