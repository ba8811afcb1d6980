// Suggests a known word for an unknown one.
#pragma once

#include <span>
#include <string>
#include <string_view>

/// ", did you mean "info"?" with the known word that begins like this one or differs by a letter or two; empty if there
/// is none.
std::string didYouMean(std::string_view word, std::span<const std::string_view> known);
