#include "media/containers/ContainerTraits.h"

#include "media/containers/StoredFormat.h"
#include "platform/core/Packed.h"

#include <algorithm>
#include <array>
#include <cstring>
#include <string_view>

namespace platform {

namespace {

FourCC codeAt(BytesView start, std::size_t offset)
{
    return start.size() >= offset + sizeof(FourCC) ? loadBE<FourCC>(start.data() + offset) : 0;
}

/// Whether a 16-byte identifier consists of this name and these bytes.
bool isIdentifier(BytesView bytes, FourCC name, std::string_view rest)
{
    return bytes.size() >= sizeof name + rest.size() && codeAt(bytes, 0) == name &&
           std::memcmp(bytes.data() + sizeof name, rest.data(), rest.size()) == 0;
}

bool isRIFF(BytesView start)
{
    const FourCC id = codeAt(start, 0);
    return (id == fourCC("RIFF") || id == fourCC("RF64") || id == fourCC("BW64")) && codeAt(start, 8) == fourCC("WAVE");
}

/// Kept: the last character is ignored, so any of them passes, not only AIFF and AIFC.
bool isIFF(BytesView start)
{
    return codeAt(start, 0) == fourCC("FORM") && codeAt(start, 8) >> 8 == fourCC("AIFF") >> 8;
}

bool isCAF(BytesView start)
{
    return start.size() >= 8 && codeAt(start, 0) == fourCC("caff");
}

bool isRIFX(BytesView start)
{
    return codeAt(start, 0) == fourCC("RIFX") && codeAt(start, 8) == fourCC("WAVE");
}

bool isWave64(BytesView start)
{
    // The last 12 bytes of the identifier of the file itself, and of all that have a name in RIFF.
    constexpr std::string_view file("\x2E\x91\xCF\x11\xA5\xD6\x28\xDB\x04\xC1\0\0", 12);
    constexpr std::string_view named("\xF3\xAC\xD3\x11\x8C\xD1\0\xC0\x4F\x8E\xDB\x8A", 12);
    return start.size() >= 40 && isIdentifier(start, fourCC("riff"), file) &&
           isIdentifier(start.subspan(24), fourCC("wave"), named);
}

bool isAU(BytesView start)
{
    return start.size() >= 8 && codeAt(start, 0) == fourCC(".snd");
}

/// Kept: so is that of "CAT ".
bool isREX2(BytesView start)
{
    return codeAt(start, 0) >> 8 == fourCC("CAT ") >> 8 && codeAt(start, 8) == fourCC("REX2") &&
           codeAt(start, 12) == fourCC("HEAD");
}

constexpr ContainerTraits::Role riffRoles[] = {{fourCC("fmt "), ChunkRole::essential},
                                               {fourCC("data"), ChunkRole::essential},
                                               {fourCC("ds64"), ChunkRole::essential},
                                               {fourCC("fact"), ChunkRole::supporting},
                                               {fourCC("JUNK"), ChunkRole::filler}};
constexpr ContainerTraits::Role iffRoles[] = {{fourCC("COMM"), ChunkRole::essential},
                                              {fourCC("SSND"), ChunkRole::essential},
                                              {fourCC("FVER"), ChunkRole::supporting}};
constexpr ContainerTraits::Role cafRoles[] = {{fourCC("desc"), ChunkRole::essential},
                                              {fourCC("data"), ChunkRole::essential},
                                              {fourCC("pakt"), ChunkRole::essential},
                                              {fourCC("kuki"), ChunkRole::essential},
                                              {fourCC("chan"), ChunkRole::supporting}};
constexpr ContainerTraits::Role rex2Roles[] = {{fourCC("HEAD"), ChunkRole::essential}};

constexpr std::uint64_t kMostUnsigned = 0xFFFFFFFE; // 0xFFFFFFFF refers to the "ds64"
constexpr std::uint64_t kMostSigned = 0x7FFFFFFF;
constexpr std::uint64_t kMost64 = INT64_MAX;

/// In the order of ContainerKind.
constexpr std::array<ContainerTraits, 7> kContainers{{
    {.kind = ContainerKind::riff,
     .fileType = fourCC("WAVE"),
     .hasChunks = true,
     .isEditable = true,
     .order = std::endian::little,
     .firstChunk = 12,
     .chunkHeaderSize = 8,
     .alignment = 2,
     .largestChunk = kMostUnsigned,
     .formatId = fourCC("fmt "),
     .soundId = fourCC("data"),
     .roles = riffRoles,
     .recognises = isRIFF,
     .readFormat = [](BytesView body, FourCC) { return storedFormatOfWAVE(body); }},
    {.kind = ContainerKind::iff,
     .fileType = fourCC("AIFF"),
     .hasChunks = true,
     .isEditable = true,
     .order = std::endian::big,
     .firstChunk = 12,
     .chunkHeaderSize = 8,
     .alignment = 2,
     .largestChunk = kMostSigned,
     .formatId = fourCC("COMM"),
     .soundId = fourCC("SSND"),
     .roles = iffRoles,
     .recognises = isIFF,
     .readFormat = [](BytesView body,
                      FourCC formType) { return storedFormatOfAIFF(body, formType == fourCC("AIFC")); }},
    {.kind = ContainerKind::caf,
     .fileType = fourCC("caff"),
     .hasChunks = true,
     .isEditable = true,
     .order = std::endian::big,
     .firstChunk = 8,
     .chunkHeaderSize = 12,
     .alignment = 1,
     .largestChunk = kMost64,
     .formatId = fourCC("desc"),
     .soundId = fourCC("data"),
     .roles = cafRoles,
     .recognises = isCAF,
     .readFormat = [](BytesView body, FourCC) { return storedFormatOfCAF(body); }},
    {.kind = ContainerKind::rifx,
     .fileType = fourCC("RIFX"),
     .hasChunks = true,
     .isEditable = false,
     .order = std::endian::big,
     .firstChunk = 12,
     .chunkHeaderSize = 8,
     .alignment = 2,
     .largestChunk = kMostUnsigned,
     .formatId = fourCC("fmt "),
     .soundId = fourCC("data"),
     .roles = riffRoles,
     .recognises = isRIFX,
     .readFormat = [](BytesView body, FourCC) { return storedFormatOfWAVE(body, std::endian::big); }},
    {.kind = ContainerKind::wave64,
     .fileType = fourCC("W64f"),
     .hasChunks = true,
     .isEditable = false,
     .order = std::endian::little,
     .firstChunk = 40,
     .chunkHeaderSize = 24,
     .alignment = 8,
     .largestChunk = kMost64,
     .formatId = fourCC("fmt "),
     .soundId = fourCC("data"),
     .roles = riffRoles,
     .recognises = isWave64,
     .readFormat = [](BytesView body, FourCC) { return storedFormatOfWAVE(body); }},
    {.kind = ContainerKind::au,
     .fileType = fourCC("NeXT"),
     .hasChunks = false,
     .isEditable = false,
     .order = std::endian::big,
     .firstChunk = 0,
     .chunkHeaderSize = 0,
     .alignment = 1,
     .largestChunk = kMostUnsigned,
     .formatId = fourCC(".snd"),
     .soundId = fourCC("data"),
     .roles = {},
     .recognises = isAU,
     .readFormat = [](BytesView body, FourCC) { return storedFormatOfAU(body); }},
    {.kind = ContainerKind::rex2,
     .fileType = fourCC("REX2"),
     .hasChunks = true,
     .isEditable = true,
     .order = std::endian::big,
     .firstChunk = 12,
     .chunkHeaderSize = 8,
     .alignment = 2,
     .largestChunk = kMostSigned,
     .formatId = 0,
     .soundId = 0,
     .roles = rex2Roles,
     .recognises = isREX2,
     .readFormat = nullptr},
}};

} // namespace

const ContainerTraits& traitsOf(ContainerKind kind)
{
    return kContainers[static_cast<std::size_t>(kind)];
}

const ContainerTraits* recogniseContainer(BytesView start)
{
    const auto* const found =
        std::ranges::find_if(kContainers, [&](const ContainerTraits& traits) { return traits.recognises(start); });
    return found != kContainers.end() ? found : nullptr;
}

ChunkRole roleOfChunk(ContainerKind kind, FourCC id)
{
    const auto roles = traitsOf(kind).roles;
    if (const auto found = std::ranges::find(roles, id, &ContainerTraits::Role::id); found != roles.end())
        return found->role;
    return id == fourCC("free") ? ChunkRole::filler : ChunkRole::userData;
}

} // namespace platform
