// One registered file of a CFileServer: whose it is, and its samples.
#pragma once

#include "files/CFileRef.h"

#include <cstdint>
#include <cstdlib>
#include <memory>
#include <vector>

/// Frees an array of samples.
struct SampleArrayDeleter {
    /// `samples` comes from malloc, or is null.
    void operator()(float* samples) const { std::free(samples); }
};
/// Samples with their owner.
using SampleArray = std::unique_ptr<float[], SampleArrayDeleter>;

/// One registered file: its clients and its samples.
struct TContainer {
    std::vector<std::uint32_t> clientIds; // in the order of registration, each once
    CFileRef ref;                         // the file
    SampleArray samples;                  // interleaved frames; null when they were not loaded
    float sampleRate = 0;                 // in Hz
    std::uint32_t channels = 0;           // 1 for a stereo file whose channels are equal
    std::uint32_t frames = 0;             // samples of each channel
    std::uint32_t retainCount = 0;        // of the file table
};

/// What a table does with a container that it takes or drops.
struct TContainerValueCallbacks {
    /// Counts up and returns the container.
    using Retain = TContainer* (*)(TContainer* container);
    /// Counts down, and deletes at 0.
    using Release = void (*)(TContainer* container);
    /// A text for debugging.
    using Description = std::string (*)(const TContainer* container);
    /// Whether two containers count as one.
    using Equality = bool (*)(const TContainer* a, const TContainer* b);

    int version = 0;                   // always 0
    Retain retain = nullptr;           // called with each container that a table takes
    Release release = nullptr;         // called with each container that a table drops
    Description description = nullptr; // none
    Equality equal = nullptr;          // none: containers are compared by their addresses
};

/// Retaining adds one to `retainCount`; releasing subtracts one and deletes the container at 0.
KT_EXPORT extern const TContainerValueCallbacks kTContainerValueCallbacks;
