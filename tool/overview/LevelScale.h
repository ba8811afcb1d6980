// Maps samples to heights in a lane, and chooses the decibels on its scale.
#pragma once

#include <string>
#include <vector>

struct Level {
    float y = 0;
    std::string label;
};

/// Full scale times the gain is where full scale is without gain: slightly inside the lane.
class LevelScale {
public:
    LevelScale(float top, float bottom, double gain);

    float y(float sample) const { return centre_ - sample * factor_ * reach_; }
    float top() const { return top_; }
    float bottom() const { return bottom_; }

    /// The level at the top, each 6 dB below it while there is room, and silence; from the top down.
    std::vector<Level> levels() const;

private:
    float top_, bottom_, centre_, reach_;
    double gain_; // decibels
    float factor_;
};
