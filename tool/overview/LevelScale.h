// From samples to heights in a lane, and the decibels that its scale names.
#pragma once

#include <string>
#include <vector>

struct Level {
    float y = 0;
    std::string label;
};

/// Full scale times the gain is where a picture without gain has full scale: a little within the lane.
class LevelScale {
public:
    LevelScale(float top, float bottom, double gain);

    float y(float sample) const { return centre_ - sample * factor_ * reach_; }
    float top() const { return top_; }
    float bottom() const { return bottom_; }

    /// What can be seen at the top, each 6 dB below it as far as there is room, and silence; from the top down.
    std::vector<Level> levels() const;

private:
    float top_, bottom_, centre_, reach_;
    double gain_; // decibels
    float factor_;
};
