#include "tool/shared/description/FileDescription.h"

#include "media/containers/AudioHandle.h"
#include "tool/shared/access/FileAccess.h"
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
    CAudioFileIO file;
    openSound(file, path);
    return file.Info();
}

void openSound(CAudioFileIO& file, const std::string& path)
{
    requireOK(file.Open(referenceTo(path), 0));
    describeOpened(file, path);
}

void describeOpened(CAudioFileIO& file, const std::string& path)
{
    const std::int32_t status = file.InfoStatus();
    if (status == platform::AudioHandle::kFormatNotSupported) // known, but not decoded here
        requireDecoder(file);
    if (status != kStatusOK || file.Info().containerId == 0)
        failForSound(path, status);
    const bool isStated = file.Info().framesAreStated;    // by a header: a decoder counts, if there is one
    if (isStated && file.OpenDecoder() == kStatusIOError) // a decoder exists, but nothing can be decoded
        failForSound(path, kStatusIOError);
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
