// What C callers hold of an audio file that is open.
#pragma once

#include "audiofile/CAudioFileIO.h"
#include "c/ktfiles.h"
#include "media/decoding/ConvertingReader.h"

#include <memory>
#include <string>

struct ktf_file {
    std::string name; // as the caller gave it
    platform::URLRef location;
    CAudioFileIO file;
    std::unique_ptr<platform::ConvertingReader> reader; // of ktf_read(); null until samples are asked for
};

/// A reader of the file's samples as 32-bit floats, at its own rate with all its channels. Null, with `status` and in
/// words, where it cannot be had.
std::unique_ptr<platform::ConvertingReader> openSampleReader(const ktf_file& file, ktf_status& status);

/// What is wrong with a file whose sound is not known, in words. The status is one of failure.
ktf_status failForSound(const ktf_file& file, CFileIO& opened, ktf_status status);
