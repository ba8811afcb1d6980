// One file decoded to another, or to standard output.
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
    bool force = false;   // replace a file that exists
    bool conceal = false; // take silence where the file is damaged
    bool quiet = false;
    bool showsProgress = false;
};

struct DecodeResult {
    std::string output;
    std::string container; // as DecodeFrame::container
    DecodedSound sound;    // with the frames that were written
    std::int64_t clippedSamples = 0;
    std::uint64_t missingFrames = 0; // as DecodeSource::missingFrames
    CarriedTags tags;
    std::vector<std::string> kept = {};  // as KeptMetadata::names
    std::vector<std::string> notes = {}; // what is not as people may expect, in words
};

/// Either the output is written whole, or what had its name is as it was. Throws Failure. With standard output gone,
/// ends and leaves it to that to say so.
DecodeResult decodeFile(const DecodeJob& job, const DecodeOptions& options);
