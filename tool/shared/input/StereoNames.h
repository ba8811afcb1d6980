// The names of stereo pairs that are stored as two mono files.
#pragma once

#include <optional>
#include <string>

/// One half of such a pair, and the other.
struct StereoHalf {
    bool isLeft = false;
    std::string partner; // its path, in the file's folder as written
    bool partnerExists = false;
};

/// Recognizes the library's own suffixes ("Bass.L.wav", "Old.ail"), then those that programs and people write: "_L",
/// "-R", " left", "(R)" and so on in any case, before an audio extension. None for a name without a stereo suffix.
/// Names need not be UTF-8.
std::optional<StereoHalf> stereoHalf(const std::string& path);
