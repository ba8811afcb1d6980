// Waveforms as the page of a library holds them.
#pragma once

#include <string>
#include <string_view>

/// Columns of the waveform of a row, at most.
inline constexpr std::size_t kPageWaveColumns = 160;

/// The points of an overview, folded: for each column the lowest and the highest value plus 128, in base64. An odd byte
/// behind the last pair is left out. Empty for no points.
std::string pageWave(std::string_view points);

/// RFC 4648, with padding.
std::string base64(std::string_view bytes);
