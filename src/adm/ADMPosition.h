// The position of a block: cartesian or polar coordinates, as `cartesian` says.
#pragma once

#include "platform/core/Export.h"

#include <string>

/// A place in the room; only the coordinates of its form mean anything.
struct KT_EXPORT ADMPosition {
    bool cartesian = false; // else polar
    float X = 0;            // to the right, normalised to -1…1, not checked
    float Y = 0;            // to the front, normalised likewise
    float Z = 0;            // upwards, normalised likewise
    float azimuth = 0;      // degrees, to the left positive
    float elevation = 0;    // degrees, upwards positive
    float distance = 1;     // normalised
    friend bool operator==(const ADMPosition&, const ADMPosition&) = default;

    /// "(x=…, y=…, z=…)" or "(azimuth=…, elevation=…, distance=…)".
    std::string description() const;
};
