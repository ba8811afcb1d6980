// Decodes one file to another, or to standard output.
#pragma once

#include "tool/decode/DecodeSource.h"
#include "tool/decode/DecodeTags.h"

#include <string>
#include <vector>

struct DecodeJob {
    std::string file;
    std::string output; // "-" is standard output
};

struct DecodeOptions {
    DecodeWishes wishes;
    bool force = false;   // replaces a file that exists
    bool conceal = false; // accepts silence where the file is damaged
    bool quiet = false;
    bool showsProgress = false;
};

struct DecodeResult {
    std::string output;
    std::string container; // as DecodeFrame::container
    DecodedSound sound;    // with the number of frames written
    std::int64_t clippedSamples = 0;
    std::uint64_t missingFrames = 0; // as DecodeSource::missingFrames
    CarriedTags tags;
    std::vector<std::string> kept = {};  // as KeptMetadata::names
    std::vector<std::string> notes = {}; // remarks for people about unexpected results
};

/// Either the output is complete, or what had its name is unchanged. Throws Failure. If standard output is gone, ends
/// without one, because that stream reports it.
DecodeResult decodeFile(const DecodeJob& job, const DecodeOptions& options);
