// Fields of WAVE files that are measured from the sound instead of typed.
#pragma once

#include "tool/meta/MetaFileEdit.h"

/// The fields that were requested.
struct MeasuredFields {
    bool loudness = false; // five fields of "bext" version 2 (EBU Tech 3285), by EBU R 128

    bool md5 = false; // the digest in "MD5 "

    bool any() const { return loudness || md5; }
};

/// Throws UsageError if a step sets a measured field, or a version of "bext" without loudness.
void requireNotTyped(const MeasuredFields& wanted, const std::vector<MetaStep>& steps);

/// As planMetadata, with additional steps for the measured fields; a value that cannot be measured becomes "not set".
/// The other steps are tried first, because measuring takes time.
MetaPlan planMeasured(const std::string& path, std::vector<MetaStep> steps, const MeasuredFields& wanted,
                      bool isLenient, bool quiet);
