#include "agreement/Answers.h"

#include "audiofile/CAudioFileIO.h"
#include "audiofile/XStream.h"
#include "loops/overview/OverviewBlock.h"
#include "media/decoding/ConvertingReader.h"
#include "platform/core/Status.h"

#include <cmath>
#include <memory>
#include <vector>

namespace {

struct StreamCloser {
    void operator()(void* stream) const { XStreamClose(stream); }
};

template <class T>
T propertyOf(void* stream, FourCC id)
{
    T value{};
    std::uint32_t size = sizeof value;
    return XStreamGetProperty(stream, id, &size, &value) == kStatusOK ? value : T{};
}

/// Reads to the end and returns the number of frames; a negative status if they cannot be read.
std::int64_t framesRead(void* stream, std::uint32_t bytesPerFrame)
{
    constexpr std::uint32_t most = 65536;
    std::vector<char> buffer(std::size_t{most} * bytesPerFrame);
    std::int64_t frames = 0;
    for (std::uint32_t got = most; got > 0; frames += got)
        if (const std::int32_t status = XStreamReadFramesSync(stream, frames, most, &got, buffer.data(), nullptr);
            status != kStatusOK)
            return status;
    return frames;
}

} // namespace

std::string Answer::text() const
{
    if (status != kStatusOK)
        return "status " + std::to_string(status);
    return fourCCText(type) + " " + std::to_string(rate) + " Hz " + std::to_string(channels) + " ch " +
           std::to_string(frames) + " frames";
}

bool Answer::isSame(const Answer& other) const
{
    // A decoder's rate is a whole number.
    return status == other.status && type == other.type && std::abs(rate - other.rate) < 1 &&
           channels == other.channels && frames == other.frames;
}

Answer describedFile(const std::string& path)
{
    const CFileRef ref(path.c_str(), false);
    AudioFileInfo info;
    Answer answer;
    {
        CFileIO file;
        answer.status = file.OpenRead(ref, 0);
        if (answer.status == kStatusOK)
            answer.status = GetAudioFileInfo(file, 0, info);
    }
    if (answer.status == kStatusOK && info.framesAreStated) {
        CAudioFileIO file(ref, 0);
        file.OpenDecoder();
        info = file.Info();
    }
    answer.type = info.fileType;
    answer.rate = info.exactSampleRate;
    answer.channels = info.channels;
    answer.frames = info.frames;
    answer.speakers = info.speakers;
    answer.isCompressed = info.compressed;
    return answer;
}

Answer streamedFile(const std::string& path)
{
    constexpr std::uint32_t takesMP3WithoutFrames = 1;
    Answer answer;
    void* opened = nullptr;
    answer.status = XStreamOpen(path.c_str(), takesMP3WithoutFrames, 0, 0, nullptr, nullptr, &opened);
    const std::unique_ptr<void, StreamCloser> stream(opened);
    if (answer.status != kStatusOK)
        return answer;
    const auto format =
        propertyOf<platform::StreamDescription>(opened, platform::ConvertingReader::clientFormatProperty);
    answer.type = propertyOf<FourCC>(opened, fourCC("#fmt"));
    answer.rate = format.sampleRate;
    answer.channels = format.channelsPerFrame;
    answer.frames = propertyOf<std::int64_t>(opened, platform::ConvertingReader::frameCountProperty);
    answer.speakers =
        static_cast<platform::ConvertingReader*>(static_cast<platform::AudioHandle*>(opened))->facts().speakers;
    const std::int64_t read = framesRead(opened, format.bytesPerFrame);
    if (read < 0) // the status says why not
        answer.status = static_cast<std::int32_t>(read);
    else if (read != answer.frames)
        answer.frames = -read; // no way reports a negative number
    return answer;
}

Answer overviewOfFile(const std::string& path)
{
    CAudioFileIO file;
    Answer answer;
    answer.status = file.Open(CFileRef(path.c_str(), false), 0);
    if (answer.status != kStatusOK)
        return answer;
    const auto block = file.CreateOverview(CAudioFileIO::OverviewProgress(), &answer.status);
    answer.type = file.Info().fileType;
    answer.rate = file.Info().exactSampleRate;
    answer.channels = file.Info().channels;
    answer.frames = block ? OverviewFrames(*block) : 0;
    return answer;
}

std::string disagreement(const std::string& path)
{
    const Answer described = describedFile(path), streamed = streamedFile(path), overview = overviewOfFile(path);
    const std::string all =
        "info: " + described.text() + "; stream: " + streamed.text() + "; overview: " + overview.text();
    if (streamed.status != kStatusOK) {
        const bool offersSound = described.status == kStatusOK && described.frames > 0 && !described.isCompressed;
        return offersSound || overview.status == kStatusOK ? all : "";
    }
    const bool isEmpty = streamed.frames == 0 && overview.status == kStatusEndOfFile; // nothing to show
    // A container may state what its coding does not, and vice versa.
    const bool isContained =
        described.type == fourCC("WAVE") || described.type == fourCC("AIFF") || described.type == fourCC("caff");
    const bool areSaid = !isContained || (described.speakers != 0 && streamed.speakers != 0);
    if (described.isCompressed && areSaid && described.speakers != streamed.speakers)
        return all + "; speakers " + std::to_string(described.speakers) + " and " + std::to_string(streamed.speakers);
    return described.isSame(streamed) && (isEmpty || overview.isSame(streamed)) ? "" : all;
}
