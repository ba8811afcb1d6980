// Fields of WAVE files that are measured of the sound rather than typed.
#pragma once

#include "tool/meta/MetaFileEdit.h"

/// Which of them are asked for.
struct MeasuredFields {
    bool loudness = false; // the five of "bext" version 2 (EBU Tech 3285), by EBU R 128

    bool md5 = false; // the digest in "MD5 "

    bool any() const { return loudness || md5; }
};

/// Throws UsageError where a step sets one that is measured, or a version of "bext" that has no loudness.
void requireNotTyped(const MeasuredFields& wanted, const std::vector<MetaStep>& steps);

/// As planMetadata, of `steps` and of those that set what is measured of the sound: what has no number to "not set".
/// The other steps are tried first, since measuring takes its time.
MetaPlan planMeasured(const std::string& path, std::vector<MetaStep> steps, const MeasuredFields& wanted,
                      bool isLenient, bool quiet);
