// One registered file of a CFileServer: whose it is, and its samples.
#pragma once

#include "files/CFileRef.h"

#include <cstdint>
#include <cstdlib>
#include <memory>
#include <vector>

struct SampleArrayDeleter {
    void operator()(float* samples) const { std::free(samples); }
};
using SampleArray = std::unique_ptr<float[], SampleArrayDeleter>;

struct TContainer {
    std::vector<std::uint32_t> clientIds; // in the order of registration, each once
    CFileRef ref;
    SampleArray samples; // interleaved frames; null when they were not loaded
    float sampleRate = 0;
    std::uint32_t channels = 0; // 1 for a stereo file whose channels are equal
    std::uint32_t frames = 0;
    std::uint32_t retainCount = 0; // the file table's
};

/// What a table does with a container that it takes or drops.
struct TContainerValueCallbacks {
    using Retain = TContainer* (*)(TContainer* container);
    using Release = void (*)(TContainer* container);
    using Description = std::string (*)(const TContainer* container);
    using Equality = bool (*)(const TContainer* a, const TContainer* b);

    int version = 0;
    Retain retain = nullptr;
    Release release = nullptr;
    Description description = nullptr; // none
    Equality equal = nullptr;          // none: containers are compared by their addresses
};

/// Retaining counts one up and returns the container; releasing counts one down and deletes it at 0.
KT_EXPORT extern const TContainerValueCallbacks kTContainerValueCallbacks;
