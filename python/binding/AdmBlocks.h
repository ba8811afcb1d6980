// The blocks of a channel format as arrays, an entry for each block.
#pragma once

#include "adm/ADMAudioChannelFormat.h"

#include <pybind11/pybind11.h>

/// A factor, of a gain in its unit, 1 being decibels.
double linearGain(double gain, int unit);

/// "times", "durations" (NaN: as long as the object), "gains", "positions" (azimuth, elevation, distance, or X, Y, Z
/// where "cartesian"), "sizes" (width, height, depth), "diffuse", "jumps", "importances", and lists "ids" and
/// "speaker_labels".
pybind11::dict blockArrays(const ADMAudioChannelFormat& channel);
