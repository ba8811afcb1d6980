#include "tool/info/CodingWords.h"

#include "audiofile/ContainerHeaders.h"

#include <fmt/format.h>

#include <algorithm>
#include <span>
#include <utility>

namespace {

using Word = std::pair<FourCC, const char*>;

constexpr Word containers[] = {
    {kRIFF, "WAVE"},
    {kCaff, "CAF"},
    {kCAT, "REX2"},
    {fourCC("WAVE"), "WAVE"}, // behind a tag
    {fourCC("RIFX"), "WAVE"}, // big-endian
    {fourCC("W64f"), "Wave64"},
    {fourCC("NeXT"), "AU"},
    {fourCC("MPG3"), "MP3"},
    {fourCC("MPG2"), "MP2"},
    {fourCC("adts"), "AAC"},
    {fourCC("loas"), "AAC"},
    {fourCC("M4A "), "M4A"},
    {fourCC("mpg4"), "MP4"},
    {fourCC("flac"), "FLAC"},
    {fourCC("ogg "), "Ogg"},
    {fourCC("asf "), "WMA"},
    {fourCC("wvpk"), "WavPack"},
    {fourCC("ape "), "APE"},
    {fourCC("ac-3"), "AC-3"},
    {fourCC("ec-3"), "E-AC-3"},
    {fourCC("dts "), "DTS"},
    {fourCC("mlp "), "MLP"},
    {fourCC("true"), "TrueHD"},
    {fourCC("tta "), "TTA"},
    {fourCC("tak "), "TAK"},
    {fourCC("mkv "), "Matroska"},
    {fourCC("mpc "), "Musepack"},
    {fourCC("mpc8"), "Musepack"},
    {fourCC("dsf "), "DSF"},
    {fourCC("iff "), "IFF"},
    {fourCC("voc "), "VOC"},
    {fourCC("amrf"), "AMR"},
};

// Those of WAVE by their registered numbers (RFC 2361 and its successors).
constexpr FourCC tagged(FourCC number)
{
    return fourCC('m', 's', 0, 0) | number;
}

constexpr Word codings[] = {
    {fourCC("lpcm"), "PCM"},         {fourCC("alaw"), "A-law"},    {fourCC("ulaw"), "mu-law"},
    {fourCC("ima4"), "IMA ADPCM"},   {fourCC("MAC3"), "MACE 3:1"}, {fourCC("MAC6"), "MACE 6:1"},
    {fourCC(".mp1"), "MP1"},         {fourCC(".mp2"), "MP2"},      {fourCC(".mp3"), "MP3"},
    {fourCC("aac "), "AAC"},         {fourCC("alac"), "ALAC"},     {fourCC("flac"), "FLAC"},
    {fourCC("vorb"), "Vorbis"},      {fourCC("opus"), "Opus"},     {fourCC("ac-3"), "AC-3"},
    {fourCC("ec-3"), "E-AC-3"},      {fourCC("dts "), "DTS"},      {fourCC("wvpk"), "WavPack"},
    {fourCC("ape "), "APE"},         {fourCC("tta "), "TTA"},      {fourCC("agsm"), "GSM"},
    {fourCC("samr"), "AMR"},         {fourCC("sawb"), "AMR-WB"},   {fourCC("true"), "TrueHD"},
    {fourCC("mlp "), "MLP"},         {fourCC("tak "), "TAK"},      {fourCC("spee"), "Speex"},
    {fourCC("GSM "), "GSM"},         {fourCC("G722"), "G.722"},    {tagged(0x02), "MS ADPCM"},
    {tagged(0x06), "A-law"},         {tagged(0x07), "mu-law"},     {tagged(0x11), "IMA ADPCM"},
    {tagged(0x31), "GSM"},           {tagged(0x40), "G.721"},      {tagged(0x50), "MP2"},
    {tagged(0x55), "MP3"},           {tagged(0x92), "AC-3"},       {tagged(0xFF), "AAC"},
    {tagged(0x160), "WMA 1"},        {tagged(0x161), "WMA 2"},     {tagged(0x162), "WMA Pro"},
    {tagged(0x163), "WMA Lossless"}, {tagged(0x2000), "AC-3"},     {tagged(0x2001), "DTS"},
    {tagged(0xF1AC), "FLAC"},
};

const char* find(std::span<const Word> words, FourCC code)
{
    const auto found = std::ranges::find(words, code, &Word::first);
    return found != words.end() ? found->second : nullptr;
}

std::string trimmed(FourCC code)
{
    std::string text = fourCCText(code);
    text.erase(text.find_last_not_of(' ') + 1);
    return text;
}

} // namespace

std::string containerWord(const AudioFileInfo& info)
{
    if (info.containerId == kFORM)
        return fourCCText(info.formType);
    const char* const word = find(containers, info.containerId);
    return word != nullptr ? word : fourCCText(info.containerId);
}

std::string codingWord(const AudioFileInfo& info)
{
    if (const char* const word = find(codings, info.formatCode); word != nullptr)
        return word;
    if (const FourCC number = info.formatCode & 0xFFFF; info.formatCode == tagged(number))
        return fmt::format("format 0x{:04X}", number);
    return trimmed(info.formatCode);
}

std::string formatWords(const AudioFileInfo& info)
{
    if (info.compressed && info.formatCode == fourCC("lpcm") && info.sourceBits > 0) // behind a tag
        return fmt::format("{}-bit", info.sourceBits);
    if (info.compressed)
        return info.sourceBits > 0 ? fmt::format("{} {}-bit", codingWord(info), info.sourceBits) : codingWord(info);
    if (info.floatingPoint)
        return fmt::format("{}-bit float", info.bitsPerSample);
    if (info.sourceBits > 0 && info.sourceBits < info.bitsPerSample)
        return fmt::format("{} in {}-bit", info.sourceBits, info.bitsPerSample);
    return fmt::format("{}-bit", info.bitsPerSample);
}
