// The part of the fast roads that is the same for all vectors. For their .cpp files only.
#pragma once

#include "media/samples/SampleExtremes.h"
#include "media/samples/SampleVectors.h"

#include <algorithm>

namespace platform {

// Conversions unroll two steps: a loop of one step has so few instructions that its speed varies by a third with the
// address where a linker places it.

/// Converts eight samples at a time with Kind::read; returns their number.
template <class Kind>
struct VectorReader {
    KT_VECTORS static std::size_t run(const void* samples, float* to, std::size_t count)
    {
        const auto* from = static_cast<const unsigned char*>(samples);
        const std::size_t whole = count / 8 * 8;
#pragma GCC unroll 2
        for (std::size_t i = 0; i < whole; i += 8)
            Kind::read(from + i * Kind::size, to + i);
        return whole;
    }
};

/// The reverse, with Kind::write.
template <class Kind>
struct VectorWriter {
    KT_VECTORS static std::size_t run(const float* from, void* samples, std::size_t count)
    {
        auto* to = static_cast<unsigned char*>(samples);
        const std::size_t whole = count / 8 * 8;
#pragma GCC unroll 2
        for (std::size_t i = 0; i < whole; i += 8)
            Kind::write(to + i * Kind::size, from + i);
        return whole;
    }
};

/// Kind::Vector holds Kind::step samples in its lanes, an even number. Kind::evenAndOdd reduces a vector of extremes to
/// those of its even and odd lanes as floats; Kind::store stores two such pairs.
template <class Kind>
struct VectorExtremes {
    using Byte = unsigned char;

    struct Lanes {
        typename Kind::Vector lowest;
        typename Kind::Vector highest;

        KT_VECTORS Lanes() : lowest(Kind::zero()), highest(Kind::zero()) {}
        KT_VECTORS inline void add(const Byte* from)
        {
            const auto samples = Kind::load(from);
            lowest = Kind::lower(samples, lowest);
            highest = Kind::higher(samples, highest);
        }
    };

    KT_VECTORS static void run(const void* samples, SampleFormat format, std::size_t samplesPerRun, std::size_t runs,
                               SampleExtremes* to)
    {
        constexpr std::size_t vector = Kind::step * Kind::size; // in bytes
        const auto* from = static_cast<const Byte*>(samples);
        const std::size_t vectors = samplesPerRun / Kind::step;
        const std::size_t rest = samplesPerRun % Kind::step;
        for (std::size_t i = 0; i < runs; ++i) {
            Lanes first, second; // so that consecutive comparisons need not wait for each other
            for (std::size_t fours = vectors / 4; fours > 0; --fours, from += 4 * vector) {
                first.add(from);
                second.add(from + vector);
                first.add(from + 2 * vector);
                second.add(from + 3 * vector);
            }
            for (std::size_t left = vectors % 4; left > 0; --left, from += vector)
                first.add(from);
            const auto lowest = Kind::lower(first.lowest, second.lowest);
            const auto highest = Kind::higher(first.highest, second.highest);
            Kind::store(to[i].lowest, Kind::template evenAndOdd<Kind::lower>(lowest),
                        Kind::template evenAndOdd<Kind::higher>(highest));
            if (rest > 0) {
                addRest(from, format, rest, to[i]);
                from += rest * Kind::size;
            }
        }
    }
    static_assert(sizeof(SampleExtremes) == 4 * sizeof(float)); // all four are stored at once

    // Adds the samples after the last whole vector.
    static void addRest(const Byte* from, SampleFormat format, std::size_t count, SampleExtremes& extremes)
    {
        SampleExtremes rest;
        sampleExtremesPlain(from, format, count, 1, &rest);
        for (const int side : {0, 1}) {
            extremes.lowest[side] = std::min(extremes.lowest[side], rest.lowest[side]);
            extremes.highest[side] = std::max(extremes.highest[side], rest.highest[side]);
        }
    }
};

} // namespace platform
