// What somebody may have meant who typed a word that is none of those that there are.
#pragma once

#include <span>
#include <string>
#include <string_view>

/// ", did you mean "info"?" of the word that begins like it, or differs by a letter or two; empty when none does.
std::string didYouMean(std::string_view word, std::span<const std::string_view> known);
