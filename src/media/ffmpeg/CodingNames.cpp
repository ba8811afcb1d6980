#include "media/ffmpeg/CodingNames.h"

#include <algorithm>
#include <span>

extern "C" {
#include <libavcodec/avcodec.h>
#include <libavcodec/codec_desc.h>
}

namespace platform::ffmpeg {

namespace {

using Flag = StreamDescription::Flag;

struct Coding {
    AVCodecID codec;
    FourCC formatId;
};

constexpr Coding codings[] = {
    {AV_CODEC_ID_MP3, fourCC(".mp3")},
    {AV_CODEC_ID_MP2, fourCC(".mp2")},
    {AV_CODEC_ID_MP1, fourCC(".mp1")},
    {AV_CODEC_ID_AAC, fourCC("aac ")},
    {AV_CODEC_ID_AAC_LATM, fourCC("aac ")},
    {AV_CODEC_ID_ALAC, fourCC("alac")},
    {AV_CODEC_ID_FLAC, fourCC("flac")},
    {AV_CODEC_ID_OPUS, fourCC("opus")},
    {AV_CODEC_ID_VORBIS, fourCC("vorb")},
    {AV_CODEC_ID_AC3, fourCC("ac-3")},
    {AV_CODEC_ID_EAC3, fourCC("ec-3")},
    {AV_CODEC_ID_PCM_ALAW, fourCC("alaw")},
    {AV_CODEC_ID_PCM_MULAW, fourCC("ulaw")},
    {AV_CODEC_ID_ADPCM_IMA_QT, fourCC("ima4")},
    {AV_CODEC_ID_AMR_NB, fourCC("samr")},
    {AV_CODEC_ID_AMR_WB, fourCC("sawb")},
    {AV_CODEC_ID_DTS, fourCC("dts ")},
    {AV_CODEC_ID_APE, fourCC("ape ")},
    {AV_CODEC_ID_WAVPACK, fourCC("wvpk")},
    {AV_CODEC_ID_TTA, fourCC("tta ")},
    {AV_CODEC_ID_GSM, fourCC("agsm")},
    {AV_CODEC_ID_MACE3, fourCC("MAC3")},
    {AV_CODEC_ID_MACE6, fourCC("MAC6")},
    {AV_CODEC_ID_ADPCM_MS, fourCC('m', 's', 0, 2)},
    {AV_CODEC_ID_GSM_MS, fourCC('m', 's', 0, 0x31)},
    {AV_CODEC_ID_ADPCM_IMA_WAV, fourCC('m', 's', 0, 0x11)},
    {AV_CODEC_ID_ADPCM_ADX, fourCC("adx ")},
    {AV_CODEC_ID_WMAV1, fourCC('m', 's', 1, 0x60)},
    {AV_CODEC_ID_WMAV2, fourCC('m', 's', 1, 0x61)},
    {AV_CODEC_ID_WMAPRO, fourCC('m', 's', 1, 0x62)},
    {AV_CODEC_ID_WMALOSSLESS, fourCC('m', 's', 1, 0x63)},
};

struct FileName {
    std::string_view demuxer;
    FourCC type;
};

constexpr FileName files[] = {
    {"flac", fourCC("flac")},
    {"ogg", fourCC("ogg ")},
    {"wav", fourCC("WAVE")},
    {"w64", fourCC("W64f")},
    {"aiff", fourCC("AIFC")},
    {"caf", fourCC("caff")},
    {"au", fourCC("NeXT")},
    {"mp3", fourCC("MPG3")},
    {"aac", fourCC("adts")},
    {"ac3", fourCC("ac-3")},
    {"eac3", fourCC("ec-3")},
    {"amr", fourCC("amrf")},
    {"asf", fourCC("asf ")},
    {"avi", fourCC("AVI ")},
    {"ape", fourCC("ape ")},
    {"wv", fourCC("wvpk")},
    {"tta", fourCC("tta ")},
    {"tak", fourCC("tak ")},
    {"mpegts", fourCC("MPGT")},
    {"mov,mp4,m4a,3gp,3g2,mj2", fourCC("mp4f")},
    {"matroska,webm", fourCC("mkv ")},
};

/// Four characters of FFmpeg's name, for formats without a name elsewhere.
FourCC nameOf(std::string_view full)
{
    char name[4] = {' ', ' ', ' ', ' '};
    std::copy_n(full.begin(), std::min<std::size_t>(full.size(), sizeof name), name);
    return fourCC(name[0], name[1], name[2], name[3]);
}

bool isLinearPCM(AVCodecID codec)
{
    return codec >= AV_CODEC_ID_PCM_S16LE && codec < AV_CODEC_ID_ADPCM_IMA_QT && codec != AV_CODEC_ID_PCM_ALAW &&
           codec != AV_CODEC_ID_PCM_MULAW;
}

/// Derives the format from FFmpeg's name, such as "pcm_f32be".
void setLinearPCM(StreamDescription& format, AVCodecID codec)
{
    const std::string_view name = avcodec_get_name(codec);
    const char kind = name.size() > 4 ? name[4] : 's';
    format.formatId = StreamDescription::linearPCM;
    format.formatFlags = (kind == 'f'   ? Flag::isFloat
                          : kind == 'u' ? 0u
                                        : Flag::isSignedInteger) |
                         Flag::isPacked | (name.ends_with("be") ? Flag::isBigEndian : 0u);
    format.bitsPerChannel = static_cast<std::uint32_t>(av_get_exact_bits_per_sample(codec));
    format.framesPerPacket = 1;
    format.bytesPerPacket = format.bytesPerFrame = format.bitsPerChannel / 8 * format.channelsPerFrame;
}

} // namespace

const char* const usedDemuxers =
    "3dostr,aa,aac,ac3,act,adx,aea,afc,aiff,alaw,amr,amrnb,amrwb,ape,apc,asf,ast,au,avi,avr,bfstm,brstm,caf,dsf,dts,"
    "dtshd,"
    "eac3,epaf,"
    "flac,flv,g722,gsm,gxf,hca,iff,ircam,iss,lvf,loas,matroska,mlp,mov,mp3,mpc,mpc8,mpeg,mpegts,mxf,nistsphere,nsv,nut,"
    "nuv,"
    "ogg,oma,paf,pvf,qcp,rm,roq,rso,sds,shn,smk,sox,swf,tak,tta,truehd,txd,voc,vqf,w64,wav,wsaud,wtv,wv,wve,xa,xwma";

int codecIdOf(FourCC formatId)
{
    const auto* found = std::find_if(std::begin(codings), std::end(codings),
                                     [&](const Coding& coding) { return coding.formatId == formatId; });
    return found != std::end(codings) ? found->codec : AV_CODEC_ID_NONE;
}

std::uint64_t framesOfBlocks(const AVCodecParameters& parameters, int bytes)
{
    const AVCodecID codec = parameters.codec_id;
    const bool isCompanded = codec == AV_CODEC_ID_PCM_ALAW || codec == AV_CODEC_ID_PCM_MULAW;
    const bool isBlocks = codec == AV_CODEC_ID_ADPCM_IMA_WAV || codec == AV_CODEC_ID_ADPCM_MS ||
                          codec == AV_CODEC_ID_ADPCM_IMA_QT || codec == AV_CODEC_ID_GSM_MS || isCompanded;
    if (!isBlocks && !isLinearPCM(codec))
        return 0;
    AVCodecParameters copy = parameters; // the query takes a non-const pointer
    const int frames = av_get_audio_frame_duration2(&copy, bytes);
    return frames > 0 ? static_cast<std::uint64_t>(frames) : 0;
}

StreamDescription fileFormatOf(const AVCodecParameters& parameters, int sourceBits, double sampleRate,
                               std::uint32_t channels)
{
    StreamDescription format;
    format.sampleRate = sampleRate;
    format.channelsPerFrame = channels;
    if (isLinearPCM(parameters.codec_id)) {
        setLinearPCM(format, parameters.codec_id);
        return format;
    }
    const auto* named = std::find_if(std::begin(codings), std::end(codings),
                                     [&](const Coding& coding) { return coding.codec == parameters.codec_id; });
    const std::uint32_t tag = parameters.codec_tag;
    format.formatId = named != std::end(codings) ? named->formatId
                      : tag > 0 && tag <= 0xFFFF ? fourCC('m', 's', 0, 0) | tag
                                                 : nameOf(avcodec_get_name(parameters.codec_id));
    const int block = parameters.block_align;
    if (const std::uint64_t frames = block > 0 ? framesOfBlocks(parameters, block) : 0) {
        format.bytesPerPacket = static_cast<std::uint32_t>(block);
        format.framesPerPacket = static_cast<std::uint32_t>(frames);
        format.bitsPerChannel = static_cast<std::uint32_t>(std::max(parameters.bits_per_coded_sample, 0));
    } else {
        const AVCodecDescriptor* descriptor = avcodec_descriptor_get(parameters.codec_id);
        const bool isLossless = descriptor != nullptr && (descriptor->props & AV_CODEC_PROP_LOSSLESS) != 0;
        format.framesPerPacket = static_cast<std::uint32_t>(std::max(parameters.frame_size, 0));
        format.bitsPerChannel = isLossless ? static_cast<std::uint32_t>(std::max(sourceBits, 0)) : 0u;
    }
    return format;
}

CodingProfile profileOf(int codec, int profile)
{
    struct Profile {
        int number;
        CodingProfile profile;
    };
    static constexpr Profile ofAAC[] = {
        {FF_PROFILE_AAC_MAIN, CodingProfile::aacMain},    {FF_PROFILE_AAC_LOW, CodingProfile::aacLC},
        {FF_PROFILE_AAC_SSR, CodingProfile::aacSSR},      {FF_PROFILE_AAC_LTP, CodingProfile::aacLTP},
        {FF_PROFILE_AAC_HE, CodingProfile::heAAC},        {FF_PROFILE_AAC_HE_V2, CodingProfile::heAACv2},
        {FF_PROFILE_AAC_LD, CodingProfile::aacLD},        {FF_PROFILE_AAC_ELD, CodingProfile::aacELD},
        {FF_PROFILE_MPEG2_AAC_LOW, CodingProfile::aacLC}, {FF_PROFILE_MPEG2_AAC_HE, CodingProfile::heAAC},
    };
    static constexpr Profile ofDTS[] = {
        {FF_PROFILE_DTS_ES, CodingProfile::dtsES},
        {FF_PROFILE_DTS_96_24, CodingProfile::dts9624},
        {FF_PROFILE_DTS_HD_HRA, CodingProfile::dtsHDHighResolution},
        {FF_PROFILE_DTS_HD_MA, CodingProfile::dtsHDMaster},
        {FF_PROFILE_DTS_EXPRESS, CodingProfile::dtsExpress},
    };
    const bool isAAC = codec == AV_CODEC_ID_AAC || codec == AV_CODEC_ID_AAC_LATM;
    const std::span<const Profile> known = isAAC                      ? std::span<const Profile>(ofAAC)
                                           : codec == AV_CODEC_ID_DTS ? std::span<const Profile>(ofDTS)
                                                                      : std::span<const Profile>();
    const auto found = std::ranges::find(known, profile, &Profile::number);
    return found != known.end() ? found->profile : CodingProfile::unknown;
}

bool isDSD(int codec)
{
    return (codec >= AV_CODEC_ID_DSD_LSBF && codec <= AV_CODEC_ID_DSD_MSBF_PLANAR) || codec == AV_CODEC_ID_DST;
}

FourCC fileTypeOf(std::string_view demuxer, std::string_view brand, int codec)
{
    if (demuxer == "iff" && isDSD(codec))
        return fourCC("dff ");
    if (brand.starts_with("M4A") || brand.starts_with("M4B"))
        return fourCC("m4af");
    const auto* found =
        std::find_if(std::begin(files), std::end(files), [&](const FileName& file) { return file.demuxer == demuxer; });
    return found != std::end(files) ? found->type : nameOf(demuxer);
}

} // namespace platform::ffmpeg
