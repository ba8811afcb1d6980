// AudioFileInfo describes an audio file: what its header says, and the loop metadata that hosts ask for most.
#pragma once

#include "media/samples/SampleConversion.h"
#include "media/samples/SoundFacts.h"
#include "platform/core/Export.h"
#include "platform/core/FourCC.h"

#include <cstdint>

class CFileIO;

/// Bus and channel formats of new files; AudioBusFormatChannels gives their channel counts.
enum TAudioBusFormat : int {
    kAudioBusUndefined = 0,
    kAudioBusMono = 1,
    kAudioBusStereo = 2,
    kAudioBusQuad = 3,
    kAudioBusLCRS = 4,
    kAudioBus5_1 = 5,
    kAudioBus6_1 = 6,
    kAudioBus7_1 = 7,
    kAudioBus7_1SDDS = 8,
    kAudioBus5_1_2 = 9,
    kAudioBus4_0_4 = 10,
    kAudioBus5_1_4 = 11,
    kAudioBus7_1_2 = 12,
    kAudioBus7_1_4 = 13,
    kAudioBus9_1_4 = 14,
};

/// What an audio file is: its container, its format, its length, its loop.
struct KT_EXPORT AudioFileInfo {
    FourCC fileType = 0;             // "WAVE", "AIFF" (AIFC too), "caff", "REX2"; "MPG3", "adts", "M4A ", "mpg4",
                                     // "flac" and others that are compressed throughout; 0 when unknown
    std::int64_t sampleRate = 44100; // frames per second, rounded
    std::int32_t bitsPerSample = 16; // of a sample's container: 24 for 20 bits in 3 bytes; 0 for compressed data
    std::int32_t channels = 1;       // interleaved in each frame
    bool byteSwapped = false;        // samples in the other byte order than the host's
    bool floatingPoint = false;      // samples are floats
    std::int64_t dataOffset = 0;     // of the first sample byte; 0 when there is none
    std::int64_t frames = 0;         // samples of each channel; 0 when unknown
    std::int64_t fileLength = 0;     // of the file, in bytes

    // The loop, from the basic tagging chunk of an AIFF or CAF file.
    float beatCount = 0;         // 0: none in the file
    std::int32_t timingFlag = 0; // 1: the file has the chunk, so that its timing, or that it has none, is known
    std::int64_t loopCount = 0;  // 1: the file is a loop
    float loopValue = 0;         // tempo in beats per minute; 0 without beats, frames or a sample rate

    // The container and the stored format.
    FourCC containerId = 0; // "RIFF", "RF64", "BW64", "FORM", "caff", "CAT "; else the file type
    FourCC formType = 0;    // "WAVE", "AIFF", "AIFC", "REX2"; 0 for CAF
    FourCC formatCode = 0;  // "lpcm" for linear PCM; AIFC compression type, CAF format id, WAVE tag as "ms\hh\ll";
                            // ".mp3", "aac ", "alac", "flac", … elsewhere
    double exactSampleRate = 44100;      // in Hz, with its fraction
    platform::SampleFormat sampleFormat; // of linear PCM
    bool compressed = false;             // frames come from a decoder, if at all; so do integers of 64 bits
    bool framesAreStated = false;     // of compressed data: by a header alone, which CAudioFileIO::OpenDecoder proves
    std::int32_t bytesPerFrame = 0;   // of linear PCM; samples left-aligned in their containers
    std::int64_t dataSize = 0;        // sample bytes that the file holds
    std::int64_t missingDataSize = 0; // sample bytes that the header promises beyond the end of the file
    TAudioBusFormat busFormat =
        kAudioBusUndefined;      // of the speakers that the header names, else the first for so many channels
    std::int32_t sourceBits = 0; // the bits of a sample that count, such as 20 of 24; in lossless codings the
                                 // original's; else 0

    // What else the file says about its sound.
    std::uint32_t speakers = 0; // those that the channels feed, as bits of WAVE's channel mask, whatever the channels'
                                // order; 0 when the file does not say
    platform::CodingProfile profile = platform::CodingProfile::unknown; // of the coding, such as the kinds of AAC
    std::int32_t audioTracks = 1;                                       // this is the first
    std::int64_t promisedFrames = 0; // of compressed data, by its headers; 0 where they promise none
    std::int64_t dsdRate = 0;        // of 1-bit sound, which is described as the PCM that it decodes to; else 0

    /// Whether everything is there that the headers promise.
    bool IsWhole() const { return missingDataSize == 0 && promisedFrames <= frames; }
    /// Whether the samples are linear PCM that the library reads itself.
    bool IsLinearPCM() const { return !compressed && bytesPerFrame > 0 && sampleFormat.isSupported(); }
    /// The tempo times 5,000, from beat count, rate and frames; the 32 low bits.
    std::uint32_t VireoLoopTempo() const;
};

/// Describes the file that `file` has open. 0; -39 for a file that ends in its header; kStatusParameterError when the
/// library knows no such audio file, with `info` holding what was understood (fileType 0, fileLength); else the
/// status of a failed read. `permission` is the mode of the open file. The mark stays.
///
/// Compressed files outside the containers, MP3, AAC and M4A, are opened a second time by their path, and so not known
/// in memory; what only the decoder module could describe is "fmt?" where it does not
/// (media/decoding/ConvertingReader.h says what to install). Of compressed data rate, channels and frames are what the
/// file says, except for `bitsPerSample` 0 and `dataOffset` 0: the number of frames is that which decoding gives,
/// unless `framesAreStated`.
KT_EXPORT std::int32_t GetAudioFileInfo(CFileIO& file, unsigned int permission, AudioFileInfo& info);

/// How many channels a bus format has; 0 for values outside 1 to 14.
KT_EXPORT int AudioBusFormatChannels(int busFormat);
/// The first bus format with that many channels; kAudioBusUndefined for none.
KT_EXPORT TAudioBusFormat AudioBusFormatForChannels(int channels);
