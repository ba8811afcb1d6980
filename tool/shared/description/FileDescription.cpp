#include "tool/shared/description/FileDescription.h"

#include "tool/shared/access/FileAccess.h"
#include "tool/shared/input/CodingWords.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

#include <cmath>

AudioFileInfo describeFile(const std::string& path, bool quiet)
{
    const FileAccess access = accessForReading(path, {.quiet = quiet});
    return describeSound(path);
}

AudioFileInfo describeSound(const std::string& path)
{
    CFileIO file;
    requireOK(file.OpenRead(referenceTo(path), 0));
    AudioFileInfo info;
    const std::int32_t status = GetAudioFileInfo(file, 0, info);
    if (status == platform::AudioHandle::kFormatNotSupported) { // known, but not decoded here
        CAudioFileIO audio;
        openAudio(audio, path);
    }
    if (status != kStatusOK || info.containerId == 0)
        failForSound(path, status);
    if (info.framesAreStated) { // by a header: a decoder counts, if there is one
        CAudioFileIO audio;
        openAudio(audio, path);
        if (audio.OpenDecoder() == kStatusIOError) // a decoder exists, but nothing can be decoded
            failForSound(path, kStatusIOError);
        return audio.Info();
    }
    return info;
}

std::int64_t promisedFrames(const AudioFileInfo& info)
{
    if (info.promisedFrames > info.frames)
        return info.promisedFrames;
    return info.missingDataSize > 0 && info.bytesPerFrame > 0 ? info.frames + info.missingDataSize / info.bytesPerFrame
                                                              : 0;
}

double durationOf(const AudioFileInfo& info)
{
    return info.exactSampleRate > 0 ? static_cast<double>(info.frames) / info.exactSampleRate : 0;
}

std::int64_t bitRateOf(const AudioFileInfo& info)
{
    if (info.audioTracks > 1)
        return 0;
    const double duration = durationOf(info);
    const std::int64_t bytes = info.dataSize > 0 ? info.dataSize : info.fileLength;
    return info.compressed && duration > 0 ? std::llround(static_cast<double>(bytes) * 8 / duration) : 0;
}
