#include "media/decoding/CompressedAudio.h"

#include "media/decoding/ConvertingReader.h"
#include "media/packets/PacketFile.h"
#include "media/packets/PacketSource.h"
#include "media/packets/TagExtents.h"
#include "media/userdata/AudioFileService.h"
#include "platform/SystemCalls.h"
#include "platform/core/Status.h"

#include <algorithm>
#include <string_view>

namespace platform {

namespace {

/// How files begin that the module handles: these bytes, compared under the mask.
struct Beginning {
    std::size_t offset;
    std::string_view bytes;
    FourCC fileType;
    std::string_view mask = {}; // empty: all bits count
};
constexpr std::string_view kFrame = "\xFF\xF6"; // sync and layer of an MPEG frame
constexpr Beginning kBeginnings[] = {
    {0, "OggS", fourCC("ogg ")},
    {0, "\x30\x26\xB2\x75", fourCC("asf ")}, // start of the identifier
    {0, "wvpk", fourCC("wvpk")},
    {0, "MAC ", fourCC("ape ")},
    {0, "TTA1", fourCC("tta ")},
    {0, "tBaK", fourCC("tak ")},
    {0, "\x1A\x45\xDF\xA3", fourCC("mkv ")},
    {0, "\x0B\x77", fourCC("ac-3")},
    {0, "fLaC", fourCC("flac")},             // after a tag
    {0, "\xFF\xF0", fourCC("adts"), kFrame}, // rates whose frames a decoder may double
    {0, "\xFF\xF4", fourCC("MPG2"), kFrame},
    {0, "\xFF\xF2", fourCC("MPG3"), kFrame},
    {0, "Creative Voice", fourCC("voc ")},
    {0, "#!AMR", fourCC("amrf")},
    {0, "NIST_1A", fourCC("nist")},
    {0, "MP+", fourCC("mpc ")},
    {0, "MPCK", fourCC("mpc8")},
    {0, "ajkg", fourCC("shn ")},
    {0, "DSD ", fourCC("dsf ")},
    {0, "FRM8", fourCC("dff ")},
    {0, "\x7F\xFE\x80\x01", fourCC("dts ")},
    {0, "\xFE\x7F\x01\x80", fourCC("dts ")}, // words of 16 bits swapped, then words of 14 bits in both orders
    {0, {"\x1F\xFF\xE8\x00", 4}, fourCC("dts ")},
    {0, {"\xFF\x1F\x00\xE8", 4}, fourCC("dts ")},
    {0, "DTSHDHDR", fourCC("dts ")},
    {4, "\xF8\x72\x6F\xBA", fourCC("mlp ")}, // TrueHD
    {4, "\xF8\x72\x6F\xBB", fourCC("mlp ")},
    {0, "\x56\xE0", fourCC("loas"), "\xFF\xE0"},
    {0, "FLV\x01", fourCC("flv ")},
    {0, {"\x47\x40\x00\x10", 4}, fourCC("MPGT"), {"\xFF\xFF\xE0\xD0", 4}}, // a packet that begins an unscrambled table
    {0, {"\x00\x00\x01\xBA", 4}, fourCC("mpeg")},
    {0, ".RMF", fourCC("rm  ")},
    {0, ".SoX", fourCC("sox ")},
    {0, "XoS.", fourCC("sox ")},
    {0, {"\x64\xA3\x00\x00", 4}, fourCC("irca"), {"\xFF\xFF\xF8\xFF", 4}}, // of four machines, in both orders
    {0, {"\x00\x00\xA3\x64", 4}, fourCC("irca"), {"\xFF\xF8\xFF\xFF", 4}},
    {0, "PVF1", fourCC("pvf ")},
    {0, " paf", fourCC("epaf")},
    {0, "fap ", fourCC("epaf")},
    {0, "2BIT", fourCC("avr ")},
    {0, {"\xF0\x7E\x00\x01", 4}, fourCC("sds "), {"\xFF\xFF\x80\xFF", 4}}, // for any channel
    {0, "ALawSoundFile", fourCC("wve ")},
    {0, {"\x80\x00\x00\x00\x03\x12\x04", 7}, fourCC("adx "), {"\xFF\xFF\x00\x00\xFF\xFF\xFF", 7}},
    {0, "nut/multimedia", fourCC("nut ")},
    {0, {"\x06\x0E\x2B\x34\x02\x05\x01\x01", 8}, fourCC("mxf ")},
    {0, "ea3\x03", fourCC("oma ")},
    {0, {"EA3\x01\x00", 5}, fourCC("oma ")},
    {0, "ADIF", fourCC("adif")},
    {8, "QLCM", fourCC("qcp ")},
    {8, "MAUD", fourCC("iff ")},
    {8, "WAVE", fourCC("WAVE")}, // after a tag
    {8, "AVI ", fourCC("AVI ")},
    {8, "XWMA", fourCC("xwma")},
    {8, "8SVX", fourCC("iff ")},
    {4, "ftyp", fourCC("mp4f")}, // a file in which the library itself finds no track
    {4, "moov", fourCC("mp4f")},
    {4, "mdat", fourCC("mp4f")},
};

bool begins(BytesView start, const Beginning& beginning)
{
    if (start.size() < beginning.offset + beginning.bytes.size())
        return false;
    for (std::size_t i = 0; i < beginning.bytes.size(); ++i) {
        const auto mask = static_cast<unsigned char>(beginning.mask.empty() ? '\xFF' : beginning.mask[i]);
        if (((std::to_integer<unsigned char>(start[beginning.offset + i]) ^
              static_cast<unsigned char>(beginning.bytes[i])) &
             mask) != 0)
            return false;
    }
    return true;
}

FourCC fileTypeOf(BytesView start)
{
    const auto* const found =
        std::ranges::find_if(kBeginnings, [&](const Beginning& beginning) { return begins(start, beginning); });
    return found != std::end(kBeginnings) ? found->fileType : 0;
}

/// The first bytes after the tags that may precede a stream of frames.
Bytes startBehindTags(const URL& url, BytesView start)
{
    constexpr std::size_t wanted = 16;
    FileStatus found;
    const bool isTagged = start.size() >= 3 && textOf(start.first(3)) == "ID3";
    const int descriptor = isTagged ? systemCalls().openFile(url.posixPath().c_str(), OpenFor::reading, &found) : -1;
    if (descriptor < 0)
        return {start.begin(), start.end()};
    PacketFile file(descriptor, static_cast<std::uint64_t>(std::max<std::int64_t>(found.size, 0)));
    const BytesView bytes = file.at(endOfLeadingTags(file), wanted);
    return {bytes.begin(), bytes.end()};
}

/// The file's type according to the decoder, if it has a name for it.
FourCC typeOfOpenFile(ConvertingReader& reader)
{
    AudioHandle* file = nullptr;
    std::uint32_t size = sizeof file;
    if (reader.property(ConvertingReader::audioFileProperty, size, &file) != kStatusOK || file == nullptr)
        return 0;
    FourCC type = 0;
    size = sizeof type;
    return file->property(AudioFile::fileTypeProperty, size, &type) == kStatusOK ? type : 0;
}

} // namespace

std::int32_t describePackets(const URL& url, CompressedAudio& audio)
{
    audio = {};
    std::int32_t status = kStatusOK;
    const auto packets = openPacketSource(url.posixPath(), &status);
    if (!packets)
        return status;
    audio = {packets->fileType(), packets->format(),
             static_cast<std::uint64_t>(std::max<std::int64_t>(packets->table().validFrames, 0)), packets->facts()};
    return kStatusOK;
}

std::int32_t describeByDecoding(const URL& url, FourCC fileType, CompressedAudio& audio)
{
    audio = {};
    audio.fileType = fileType;
    std::int32_t status = kStatusOK;
    const auto reader = ConvertingReader::open(url, &status);
    if (reader) {
        if (const FourCC type = typeOfOpenFile(*reader); type != 0)
            audio.fileType = type;
        audio.format = reader->fileFormat();
        audio.format.sampleRate = reader->clientFormat().sampleRate;
        audio.format.channelsPerFrame = reader->clientFormat().channelsPerFrame;
        audio.frames = reader->frameCount();
        audio.facts = reader->facts();
    }
    return status;
}

std::int32_t describeCompressedAudio(const URL& url, BytesView start, CompressedAudio& audio)
{
    const std::int32_t asPackets = describePackets(url, audio);
    if (asPackets != AudioHandle::kFormatNotSupported)
        return asPackets;
    const FourCC fileType = fileTypeOf(startBehindTags(url, start));
    if (fileType == 0)
        return kStatusParameterError;
    const std::int32_t byEnds = describeByEnds(url.posixPath(), fileType, audio);
    return byEnds != AudioHandle::kFormatNotSupported ? byEnds : describeByDecoding(url, fileType, audio);
}

} // namespace platform
