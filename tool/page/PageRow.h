// A sound as the page of a library shows it.
#pragma once

#include "tool/shared/library/LibraryRecord.h"

#include <optional>
#include <string>

struct PageRow {
    FilePlace place;
    std::int64_t size = 0, modified = 0; // as the index knows them
    std::optional<double> tempo, durationSeconds;
    std::string key; // "F♯ minor"
    int note = -1;   // 0 to 11: C to B; -1 for none
    std::string mode;
    std::string category;
    std::string kind;
    std::string format; // "WAVE"
    std::string detail; // "24-bit 48k"
    std::string type;   // the media type by which a browser says whether it plays it; empty: none does
    std::string wave;   // pageWave()
    std::string words;  // what else a search looks at
    std::string problem;
    bool isGone = false;

    // A short sound for browsers that do not play the file: a link to it, or itself in base64.
    std::string previewLink, previewSound;
    double previewSeconds = 0;

    bool isSilent() const { return isGone || !problem.empty(); }
};

/// Looks whether the file is there.
PageRow pageRow(const LibraryRecord& record);

/// The media type of the sound in a file, with its coding where that decides; empty for what no browser plays.
std::string browserType(const LibraryRecord& record);

/// Whether browsers play files of that type nowadays, all of them; others play more.
bool isPlayedEverywhere(const std::string& type);
