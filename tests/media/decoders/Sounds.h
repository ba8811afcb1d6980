// One sound, and files of it made by other programs.
#pragma once

#include "media/decoding/ConvertingReader.h"
#include "support/Programs.h"

#include <cstdint>
#include <string>
#include <vector>

/// A swelling chord with bursts of noise, the same at every call. Interleaved, within +-0.9.
std::vector<float> sound(std::uint32_t frames, std::uint32_t channels, double sampleRate);

/// Writes the sound as a WAVE file of 16 or 24 bits.
void writeSound(const std::string& path, std::uint32_t frames, std::uint32_t channels, double sampleRate, int bits);

/// A sound that makes encoders switch modes, in sections of different lengths: a chord, digital silence, full-scale
/// noise, full-scale squares, and attacks; each channel differs.
std::vector<float> roughSound(std::uint32_t frames, std::uint32_t channels, double sampleRate);
void writeRoughSound(const std::string& path, std::uint32_t frames, std::uint32_t channels, double sampleRate,
                     int bits);

std::unique_ptr<platform::ConvertingReader> openReader(const std::string& path, std::int32_t* status = nullptr,
                                                       platform::Error* error = nullptr);

/// At most `frames` frames from `frame` on in the client format, as bytes; fails the running test if they cannot be
/// read.
Bytes framesOf(platform::ConvertingReader& reader, std::uint64_t frame, std::uint32_t frames);
/// All frames, read in blocks of `block` frames.
Bytes allFramesOf(platform::ConvertingReader& reader, std::uint32_t block);
