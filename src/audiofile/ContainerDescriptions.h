// How each container is described: what GetAudioFileInfo hands on to, and what the containers share.
#pragma once

#include "audiofile/AudioFileInfo.h"
#include "audiofile/ChunkWalk.h"
#include "audiofile/FileWindow.h"
#include "loops/tagging/LoopTiming.h"
#include "media/containers/StoredFormat.h"

#include <cstdint>
#include <functional>
#include <optional>

/// What GetAudioFileInfo does, over a window that stays in use. `url` is where others may open the file; null for one
/// in memory.
std::int32_t DescribeAudioFile(FileWindow& file, const platform::URLRef& url, AudioFileInfo& info);

// Each fills `info`, whose fileLength is set, from the file's chunks. 0, or kStatusEndOfFile when what a file of the
// kind cannot do without is missing.
std::int32_t DescribeWAVE(FileWindow& file, AudioFileInfo& info);
std::int32_t DescribeAIFF(FileWindow& file, AudioFileInfo& info);
std::int32_t DescribeCAF(FileWindow& file, const platform::URLRef& url, AudioFileInfo& info);
std::int32_t DescribeFLAC(FileWindow& file, AudioFileInfo& info);
/// A file in none of these containers, which begins with `start`; as platform::describeCompressedAudio.
std::int32_t DescribeCompressed(const platform::URL& url, BytesView start, AudioFileInfo& info);

/// The type code by which hosts know a file that the platform's services may name otherwise.
FourCC HostFileType(FourCC type);

/// Sets the sample rate: as it is, and rounded. What is no rate (NaN, infinite, negative, beyond 2^53) gives 0.
void SetSampleRate(AudioFileInfo& info, double rate);
/// Sets channels, rate and coding; of linear PCM also how its samples stand, left-aligned in their bytes.
void SetStoredFormat(AudioFileInfo& info, const platform::StoredFormat& format);
/// Sets the sample data: `size` bytes at `offset`, of which those beyond the end of the file are not counted.
void SetSampleData(AudioFileInfo& info, std::int64_t offset, std::uint64_t size);
/// Sets what else is known of the sound, behind the frames; what the container has said already stays.
void SetSoundFacts(AudioFileInfo& info, const platform::SoundFacts& facts);
/// Sets the loop fields, behind all others.
void SetLoopTiming(AudioFileInfo& info, const std::optional<tagging::LoopTiming>& timing);

/// Calls `visit(const ChkHeader&, std::int64_t bodyOffset)` for each chunk of a RIFF-family or FORM container until it
/// returns false. The container's size is not trusted: the walk goes on to the end of the file.
template <class Visit>
void VisitChunks(FileWindow& file, const ContainerChkExtended& header, Visit&& visit)
{
    const auto read = [&](void* to, std::int64_t at, std::size_t count) { return file.read(to, at, count); };
    std::int32_t error = kStatusOK;
    ChkHeader chunk;
    ChkHeader next;
    std::int64_t position = NextChunkFrom(read, file.length(), header, 0, chunk, chunk, error);
    while (error == kStatusOK && visit(chunk, position + std::int64_t{sizeof chunk})) {
        const std::int64_t following = NextChunkFrom(read, file.length(), header, position, chunk, next, error);
        if (following <= position || following >= file.length())
            return;
        position = following;
        chunk = next;
    }
}
