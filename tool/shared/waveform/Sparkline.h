// A waveform in one line of text.
#pragma once

#include "tool/shared/waveform/WaveformOutline.h"

#include <string>

/// `cells` characters from "▁" (silence) to "█" (full scale), each the peak of its share of the file.
std::string sparkline(const Waveform& waveform, int cells);
