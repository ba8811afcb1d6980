// Where a block's sound is: cartesian or polar coordinates, as `cartesian` says.
#pragma once

#include "platform/core/Export.h"

#include <string>

struct KT_EXPORT ADMPosition {
    bool cartesian = false;
    float X = 0;
    float Y = 0;
    float Z = 0;
    float azimuth = 0;   // degrees
    float elevation = 0; // degrees
    float distance = 1;  // normalised
    friend bool operator==(const ADMPosition&, const ADMPosition&) = default;

    /// "(x=…, y=…, z=…)" or "(azimuth=…, elevation=…, distance=…)".
    std::string description() const;
};
