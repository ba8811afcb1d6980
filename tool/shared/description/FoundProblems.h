// What is wrong with a file: in its container, its chunks, the length of its sound.
#pragma once

#include "audiofile/CAudioFileIO.h"

#include <cstdint>
#include <optional>
#include <string>
#include <vector>

/// One problem.
struct FoundProblem {
    const char* name; // as in JSON
    std::string text, effect;
    FourCC chunk = 0; // 0 in files without chunks
    std::uint64_t offset = 0;
};

/// What is looked at beside sizes, order and counts.
struct ProblemChecks {
    bool comparesDigests = false; // those that the file states, which takes all of its samples
    bool showsProgress = false;   // on standard error while they are read
};

/// The caller keeps writers away. Throws Failure.
std::vector<FoundProblem> problemsOf(const std::string& path, const ProblemChecks& checks);
/// The same of a file that is open with OpenForChunks; none for a file that is no container, whose length alone can be
/// checked.
std::optional<std::vector<FoundProblem>> problemsOfContainer(CAudioFileIO& file, const std::string& path,
                                                             const ProblemChecks& checks);
/// For compressed files only the length can be checked.
std::vector<FoundProblem> problemsOfLength(const AudioFileInfo& info);
