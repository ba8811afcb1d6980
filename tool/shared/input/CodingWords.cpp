#include "tool/shared/input/CodingWords.h"

#include "media/containers/ContainerHeaders.h"

#include <fmt/format.h>

#include <algorithm>
#include <iterator>
#include <utility>

namespace {

using Word = std::pair<FourCC, const char*>;

constexpr Word containers[] = {
    {kRIFF, "WAVE"},
    {kCaff, "CAF"},
    {kCAT, "REX2"},
    {fourCC("WAVE"), "WAVE"}, // after a tag
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
    {fourCC("dff "), "DFF"},
    {fourCC("iff "), "IFF"},
    {fourCC("voc "), "VOC"},
    {fourCC("amrf"), "AMR"},
    {fourCC("adif"), "AAC in ADIF"},
    {fourCC("sox "), "SoX"},
    {fourCC("irca"), "IRCAM"},
    {fourCC("pvf "), "PVF"},
    {fourCC("epaf"), "PAF"},
    {fourCC("avr "), "AVR"},
    {fourCC("sds "), "SDS"},
    {fourCC("wve "), "WVE"},
    {fourCC("adx "), "ADX"},
    {fourCC("nut "), "NUT"},
    {fourCC("mxf "), "MXF"},
    {fourCC("oma "), "OMA"},
    {fourCC("qcp "), "QCP"},
    {fourCC("rm  "), "RealMedia"},
    {fourCC("MPGT"), "MPEG-TS"},
    {fourCC("mpeg"), "MPEG-PS"},
    {fourCC("AVI "), "AVI"},
    {fourCC("flv "), "FLV"},
    {fourCC("shn "), "Shorten"},
    {fourCC("nist"), "NIST SPHERE"},
};

// WAVE's formats by their registered numbers (RFC 2361 and its successors).
constexpr FourCC tagged(FourCC number)
{
    return fourCC('m', 's', 0, 0) | number;
}

constexpr Word codings[] = {
    {fourCC("lpcm"), "PCM"},         {fourCC("alaw"), "A-law"},     {fourCC("ulaw"), "mu-law"},
    {fourCC("ima4"), "IMA ADPCM"},   {fourCC("MAC3"), "MACE 3:1"},  {fourCC("MAC6"), "MACE 6:1"},
    {fourCC(".mp1"), "MP1"},         {fourCC(".mp2"), "MP2"},       {fourCC(".mp3"), "MP3"},
    {fourCC("aac "), "AAC"},         {fourCC("alac"), "ALAC"},      {fourCC("flac"), "FLAC"},
    {fourCC("vorb"), "Vorbis"},      {fourCC("opus"), "Opus"},      {fourCC("ac-3"), "AC-3"},
    {fourCC("ec-3"), "E-AC-3"},      {fourCC("dts "), "DTS"},       {fourCC("wvpk"), "WavPack"},
    {fourCC("ape "), "APE"},         {fourCC("tta "), "TTA"},       {fourCC("agsm"), "GSM"},
    {fourCC("samr"), "AMR"},         {fourCC("sawb"), "AMR-WB"},    {fourCC("true"), "TrueHD"},
    {fourCC("mlp "), "MLP"},         {fourCC("tak "), "TAK"},       {fourCC("spee"), "Speex"},
    {fourCC("GSM "), "GSM"},         {fourCC("G722"), "G.722"},     {tagged(0x02), "MS ADPCM"},
    {tagged(0x06), "A-law"},         {tagged(0x07), "mu-law"},      {tagged(0x11), "IMA ADPCM"},
    {tagged(0x31), "GSM"},           {tagged(0x40), "G.721"},       {tagged(0x50), "MP2"},
    {tagged(0x55), "MP3"},           {tagged(0x92), "AC-3"},        {tagged(0xFF), "AAC"},
    {tagged(0x160), "WMA 1"},        {tagged(0x161), "WMA 2"},      {tagged(0x162), "WMA Pro"},
    {tagged(0x163), "WMA Lossless"}, {tagged(0x2000), "AC-3"},      {tagged(0x2001), "DTS"},
    {tagged(0xF1AC), "FLAC"},        {fourCC("dsd_"), "DSD"},       {fourCC("dst "), "DST"},
    {fourCC("adx "), "ADX ADPCM"},   {fourCC("muse"), "Musepack"},  {fourCC("shor"), "Shorten"},
    {fourCC("adpc"), "ADPCM"},       {fourCC("cook"), "Cook"},      {fourCC("atra"), "ATRAC"},
    {fourCC("nell"), "Nellymoser"},  {fourCC("qdm2"), "QDesign 2"}, {fourCC("g723"), "G.723.1"},
    {fourCC("g726"), "G.726"},       {fourCC("g729"), "G.729"},
};

using platform::CodingProfile;
constexpr std::pair<CodingProfile, const char*> profiles[] = {
    {CodingProfile::aacMain, "AAC Main"},      {CodingProfile::aacLC, "AAC-LC"},
    {CodingProfile::aacSSR, "AAC-SSR"},        {CodingProfile::aacLTP, "AAC-LTP"},
    {CodingProfile::heAAC, "HE-AAC"},          {CodingProfile::aacLD, "AAC-LD"},
    {CodingProfile::heAACv2, "HE-AAC v2"},     {CodingProfile::aacELD, "AAC-ELD"},
    {CodingProfile::xHEAAC, "xHE-AAC"},        {CodingProfile::dtsES, "DTS-ES"},
    {CodingProfile::dts9624, "DTS 96/24"},     {CodingProfile::dtsHDHighResolution, "DTS-HD HRA"},
    {CodingProfile::dtsHDMaster, "DTS-HD MA"}, {CodingProfile::dtsExpress, "DTS Express"},
};

// By the speakers' bits; speakers behind and beside the listener have the same names.
constexpr std::pair<std::uint32_t, const char*> layouts[] = {
    {0x4, "mono"},      {0x3, "stereo"},     {0xB, "2.1"},       {0x7, "3.0"},       {0x103, "3.0 (back)"},
    {0xF, "3.1"},       {0x33, "quad"},      {0x603, "quad"},    {0x107, "4.0"},     {0x10F, "4.1"},
    {0x37, "5.0"},      {0x607, "5.0"},      {0x3F, "5.1"},      {0x60F, "5.1"},     {0x137, "6.0"},
    {0x707, "6.0"},     {0x13F, "6.1"},      {0x70F, "6.1"},     {0x637, "7.0"},     {0x63F, "7.1"},
    {0xFF, "7.1 wide"}, {0x6CF, "7.1 wide"}, {0x503F, "5.1.2"},  {0x2D033, "4.0.4"}, {0x2D03F, "5.1.4"},
    {0x563F, "7.1.2"},  {0x2D63F, "7.1.4"},  {0x2D6FF, "9.1.4"},
};
constexpr const char* speakers[] = {"L",  "R",  "C",  "LFE", "Lrs", "Rrs", "Lc",  "Rc",  "Cs",
                                    "Ls", "Rs", "Tc", "Tfl", "Tfc", "Tfr", "Tbl", "Tbc", "Tbr"};

template <class Table, class Key>
const char* find(const Table& words, Key key)
{
    const auto found = std::ranges::find(words, key, &std::ranges::range_value_t<Table>::first);
    return found != std::end(words) ? found->second : nullptr;
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
    return word != nullptr ? word : trimmed(info.containerId);
}

std::string codingWord(const AudioFileInfo& info)
{
    if (const char* const word = find(profiles, info.profile); word != nullptr)
        return word;
    if (const char* const word = find(codings, info.formatCode); word != nullptr)
        return word;
    if (const FourCC number = info.formatCode & 0xFFFF; info.formatCode == tagged(number))
        return fmt::format("format 0x{:04X}", number);
    return trimmed(info.formatCode);
}

std::string layoutWord(const AudioFileInfo& info)
{
    if (const char* const word = find(layouts, info.speakers); word != nullptr)
        return word;
    if (info.speakers >> std::size(speakers) != 0)
        return {};
    std::string words;
    for (std::size_t i = 0; i < std::size(speakers); ++i)
        if ((info.speakers >> i & 1) != 0)
            words += (words.empty() ? "" : "+") + std::string(speakers[i]);
    return words;
}

// Decoders deliver channels in the order of the mask, and WAVE stores them so; other containers of linear PCM have
// their own order, which the mask does not tell.
std::vector<std::string> channelWords(const AudioFileInfo& info)
{
    const bool isInOrder = info.compressed || info.fileType == kWAVE;
    const std::uint32_t known = info.speakers != 0 ? info.speakers : info.channels == 2 ? 0x3 : 0;
    std::vector<std::string> words;
    if (isInOrder || known == 0x3)
        for (std::size_t i = 0; i < std::size(speakers); ++i)
            if ((known >> i & 1) != 0)
                words.emplace_back(speakers[i]);
    if (words.size() == static_cast<std::size_t>(info.channels))
        return words;
    words.clear();
    for (int channel = 1; channel <= info.channels; ++channel)
        words.push_back(fmt::format("Ch {}", channel));
    return words;
}

std::string formatWords(const AudioFileInfo& info)
{
    if (info.dsdRate > 0) {
        const std::string coding = codingWord(info);
        return fmt::format("{}{:.10g} MHz", coding == "DSD" ? "DSD " : coding + " DSD ",
                           static_cast<double>(info.dsdRate) / 1e6);
    }
    if (info.compressed && info.formatCode == fourCC("lpcm") && info.sourceBits > 0) // after a tag
        return fmt::format("{}-bit", info.sourceBits);
    if (info.compressed)
        return info.sourceBits > 0 ? fmt::format("{} {}-bit", codingWord(info), info.sourceBits) : codingWord(info);
    if (info.floatingPoint)
        return fmt::format("{}-bit float", info.bitsPerSample);
    if (info.sourceBits > 0 && info.sourceBits < info.bitsPerSample)
        return fmt::format("{} in {}-bit", info.sourceBits, info.bitsPerSample);
    return fmt::format("{}-bit", info.bitsPerSample);
}
