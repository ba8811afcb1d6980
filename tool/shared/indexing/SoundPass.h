// Goes once through all samples of a file for all that is made of them.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "tool/shared/library/LibraryRecord.h"

#include <cstdint>
#include <functional>
#include <optional>
#include <string>

struct SoundPassWish {
    bool waveform = false, hash = false;
    std::function<bool()> goesOn = {}; // asked now and then; its no ends the pass with kStatusUserCancelled
};

struct SoundPass {
    std::optional<LibraryOverview> waveform; // none without sound that can be read
    std::string hash;                        // SHA-256 in hexadecimal; empty without sound that can be read
    std::int32_t status = 0;                 // of a failed read; then there is nothing
};

/// The hash is that of the bytes of the samples, where they lie in one piece in the file, as `info --sha256` says; of
/// other compressed sound that of the samples that decoding gives, as 32-bit floats, so that tags do not count.
SoundPass passThroughSound(CAudioFileIO& file, const std::string& path, const SoundPassWish& wanted);
