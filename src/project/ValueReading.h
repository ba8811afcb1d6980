// Values of property lists, read as what their keys promise; anything else reads as absent.
#pragma once

#include "platform/core/Value.h"

#include <cmath>
#include <cstdint>
#include <optional>

/// A number of any kind as an integer; booleans are 0 and 1, as other writers store them, and fractions are cut off.
/// Null for other values, and for numbers that do not fit.
inline std::optional<std::int64_t> integerOf(const platform::Value* value)
{
    if (value == nullptr)
        return std::nullopt;
    if (const auto* integer = value->get<std::int64_t>())
        return *integer;
    if (const auto* flag = value->get<bool>())
        return *flag ? 1 : 0;
    if (const auto* real = value->get<double>(); real != nullptr && std::abs(*real) < 9.2e18)
        return static_cast<std::int64_t>(*real);
    return std::nullopt;
}

/// A number of any kind; 0 for other values and for numbers that are not finite.
inline double realOf(const platform::Value* value)
{
    const auto* real = value != nullptr ? value->get<double>() : nullptr;
    if (real != nullptr)
        return std::isfinite(*real) ? *real : 0;
    return static_cast<double>(integerOf(value).value_or(0));
}

/// The value of a key; null when absent.
inline const platform::Value* valueFor(const platform::Dictionary& dictionary, const char* key)
{
    const auto found = dictionary.find(std::string_view(key));
    return found == dictionary.end() ? nullptr : &found->second;
}
