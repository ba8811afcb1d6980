#include "tool/info/FileDescription.h"

#include "tool/shared/access/FileAccess.h"
#include "tool/shared/input/CodingWords.h"
#include "tool/shared/input/InputFile.h"
#include "tool/shared/output/Failure.h"

namespace {

/// Of a file that is known, but not decoded here.
void failAsDecoderDoes(const std::string& path, const std::string& kind)
{
    CAudioFileIO audio;
    openAudio(audio, path);
    try {
        requireDecoder(audio);
    } catch (const Failure& failure) {
        throw Failure(kind + ": " + failure.what());
    }
}

} // namespace

AudioFileInfo describeFile(const std::string& path, bool quiet)
{
    const FileAccess access = accessForReading(path, {.quiet = quiet});
    CFileIO file;
    requireOK(file.OpenRead(referenceTo(path), 0));
    AudioFileInfo info;
    const std::int32_t status = GetAudioFileInfo(file, 0, info);
    if (file.GetEOF() == 0)
        throw OtherKind("is empty", OtherKind::Kind::unknown);
    if (status == platform::AudioHandle::kFormatNotSupported)
        failAsDecoderDoes(path, containerWord(info));
    if (status == kStatusEndOfFile)
        throw Failure("ends within its header");
    if (status == kStatusParameterError || (status == kStatusOK && info.containerId == 0))
        throw OtherKind("no audio file known here", OtherKind::Kind::unknown);
    requireOK(status);
    if (info.framesAreStated) { // by a header: the decoder, where there is one, counts
        CAudioFileIO audio;
        openAudio(audio, path);
        audio.OpenDecoder();
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
