#include "tool/decode/DecodeFormat.h"

#include "audiofile/AudioFileHeader.h"
#include "audiofile/AudioFileLimits.h"
#include "files/AudioFileTypes.h"
#include "media/containers/ContainerHeaders.h"
#include "tool/shared/output/Failure.h"

#include <fmt/format.h>

#include <algorithm>
#include <array>
#include <cmath>
#include <filesystem>
#include <limits>

namespace {

constexpr std::array<DecodeFormat, 4> kFormats{{{"wav", kWAVE}, {"aiff", kAIFF}, {"caf", kCaff}, {"raw", 0}}};

const char* nameOf(FourCC fileType)
{
    return fileType == kWAVE ? "a WAVE" : fileType == kAIFF ? "an AIFF" : "a CAF";
}

} // namespace

std::span<const DecodeFormat> decodeFormats()
{
    return kFormats;
}

const DecodeFormat* decodeFormatNamed(std::string_view name)
{
    const auto found = std::find_if(kFormats.begin(), kFormats.end(),
                                    [name](const DecodeFormat& format) { return format.name == name; });
    return found != kFormats.end() ? &*found : nullptr;
}

const DecodeFormat* decodeFormatOf(const std::string& path)
{
    const std::string extension = std::filesystem::path(path).extension().string();
    if (extension.empty())
        return kFormats.data();
    const FourCC type = CFileUtilFileTypeOfExtension(std::string_view(extension).substr(1));
    const auto found = std::find_if(kFormats.begin(), kFormats.end(), [type](const DecodeFormat& format) {
        return type != 0 && format.fileType == type;
    });
    return found != kFormats.end() ? &*found : decodeFormatNamed(std::string_view(extension).substr(1));
}

std::string depthText(SampleDepth depth)
{
    return fmt::format("{}-bit{}", depth.bits, depth.isFloat ? " float" : "");
}

platform::StreamDescription streamOf(const DecodedSound& sound, const DecodeFormat& format)
{
    // For 8-bit samples the byte order determines their sign.
    const bool isBig = format.fileType == kAIFF || (format.fileType == kCaff && sound.depth.bits == 8);
    return platform::StreamDescription::packedPCM(sound.sampleRate, sound.channels,
                                                  {.bits = sound.depth.bits,
                                                   .isFloat = sound.depth.isFloat,
                                                   .order = isBig ? std::endian::big : std::endian::little});
}

DecodeFrame::DecodeFrame(const DecodedSound& sound, const DecodeFormat& format, Bytes chunks)
    : sound_(sound),
      fileType_(format.fileType),
      chunks_(std::move(chunks))
{
    if (sound.frames > std::numeric_limits<std::int64_t>::max() / sound.bytesPerFrame())
        throw Failure("has too much sound for any file");
    if (fileType_ == 0)
        return;
    const std::int64_t ahead = std::int64_t{kMaxAudioFileHeaderSize} + std::ssize(chunks_);
    reservesRoom_ = fileType_ == kWAVE && sound.bytes() > MaxAudioFileSize(kWAVE, false) - ahead;
    if (sound.bytes() > MaxAudioFileSize(fileType_, true) - ahead)
        throw Failure(fmt::format("has too much sound for {} file, {} bytes", nameOf(fileType_), sound.bytes()));
    if (header(sound.frames).empty())
        throw Failure(fmt::format("{} file does not hold {} channels of {} at {:.10g} Hz", nameOf(fileType_),
                                  sound.channels, depthText(sound.depth), sound.sampleRate));
}

std::string DecodeFrame::header(std::int64_t frames) const
{
    if (fileType_ == 0)
        return {};
    const int bits = sound_.depth.isFloat && sound_.depth.bits == 32 ? -32 : sound_.depth.bits;
    const Bytes header =
        MakeAudioFileHeader(fileType_, frames, std::llround(sound_.sampleRate), static_cast<int>(sound_.channels), bits,
                            sound_.busFormat, reservesRoom_, chunks_);
    return std::string(textOf(header));
}

std::string DecodeFrame::trailer(std::int64_t frames) const
{
    DecodedSound sound = sound_;
    sound.frames = frames;
    const bool isPadded = fileType_ == kWAVE || fileType_ == kAIFF;
    return std::string(isPadded ? static_cast<std::size_t>(sound.bytes() & 1) : 0, '\0');
}

std::string DecodeFrame::container() const
{
    if (fileType_ == 0)
        return "raw";
    if (fileType_ == kAIFF)
        return sound_.depth.isFloat ? "AIFC" : "AIFF";
    return fileType_ == kCaff ? "CAF" : header(sound_.frames).starts_with("RF64") ? "RF64" : "WAVE";
}
