// The names of stereo pairs that are kept as two mono files.
#pragma once

#include <optional>
#include <string>

/// One half of a stereo pair that is kept as two mono files, and the other.
struct StereoHalf {
    bool isLeft = false;
    std::string partner; // its path, in the folder of the file as that was written
    bool partnerExists = false;
};

/// By the library's own suffixes ("Bass.L.wav", "Old.ail"), then by those that programs and people write: "_L", "-R",
/// " left", "(R)" and so on, in any case, ahead of an audio extension. None for a name without a stereo suffix. Names
/// need not be UTF-8.
std::optional<StereoHalf> stereoHalf(const std::string& path);
