// One sound, and files of it that other programs make.
#pragma once

#include "media/decoding/ConvertingReader.h"
#include "support/Programs.h"

#include <cstdint>
#include <string>
#include <vector>

/// The sound: a chord that swells, with bursts of noise in it; the same at every call. Interleaved, within +-0.9.
std::vector<float> sound(std::uint32_t frames, std::uint32_t channels, double sampleRate);

/// Writes it as a WAVE file of 16 or 24 bits.
void writeSound(const std::string& path, std::uint32_t frames, std::uint32_t channels, double sampleRate, int bits);

/// A sound that makes encoders change their ways, all of them of another length: a chord, digital silence, noise at
/// full scale, squares at full scale, and attacks; each channel has its own.
std::vector<float> roughSound(std::uint32_t frames, std::uint32_t channels, double sampleRate);
void writeRoughSound(const std::string& path, std::uint32_t frames, std::uint32_t channels, double sampleRate,
                     int bits);

std::unique_ptr<platform::ConvertingReader> openReader(const std::string& path, std::int32_t* status = nullptr,
                                                       platform::Error* error = nullptr);

/// The bytes of at most `frames` frames from `frame` on, in the client format; fails the running test when they cannot
/// be read.
Bytes framesOf(platform::ConvertingReader& reader, std::uint64_t frame, std::uint32_t frames);
/// All of them, read on end in blocks of `block` frames.
Bytes allFramesOf(platform::ConvertingReader& reader, std::uint32_t block);
