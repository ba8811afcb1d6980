#include "loops/tags/LoopTagFields.h"

#include "loops/VireoLoopChunks.h"
#include "loops/VireoLoopTerms.h"
#include "platform/core/ASCIICase.h"

#include <algorithm>
#include <iterator>
#include <limits>

namespace {

using Kind = LoopTagField::Kind;

constexpr std::int64_t kMost16 = std::numeric_limits<std::int16_t>::max();
constexpr std::int64_t kMost32 = std::numeric_limits<std::int32_t>::max();

constexpr LoopTagField kFields[] = {
    {"beatCount", "beats", VireoLoopCombinedTagsChunkDataBeatCountKey, Kind::number, false, 0, kMost32},
    {"midiRootNote", "rootNote", VireoLoopCombinedTagsChunkDataMidiRootNoteKey, Kind::number, false, 0, 127},
    {"keyType", "mode", VireoLoopCombinedTagsChunkDataKeyType, Kind::number, false, 0, 4},
    {"signatureTop", "signatureTop", VireoLoopCombinedTagsChunkDataSignatureTopKey, Kind::number, false, 1, kMost16},
    {"signatureBottom", "signatureBottom", VireoLoopCombinedTagsChunkDataSignatureBottomKey, Kind::number, false, 1,
     kMost16},
    {"loopFileType", "kind", VireoLoopCombinedTagsChunkDataFileTypeKey, Kind::number, false, 1, 2},
    {"instrumentType", "category", VireoLoopCombinedTagsChunkDataInstrumentTypeKey, Kind::text},
    {"instrumentSubType", "subCategory", VireoLoopCombinedTagsChunkDataInstrumentSubTypeKey, Kind::text},
    {"genre", "genre", VireoLoopCombinedTagsChunkDataGenreKey, Kind::text},
    {"descriptors", "descriptors", VireoLoopCombinedTagsChunkDataDescriptorsKey, Kind::list},
    {"title", "title", VireoLoopFileInfoChunkDataTitleKey, Kind::text, true},
    {"artist", "artist", VireoLoopFileInfoChunkDataArtistKey, Kind::text, true},
    {"copyright", "copyright", VireoLoopFileInfoChunkDataCopyrightKey, Kind::text, true},
    {"comments", "comments", VireoLoopFileInfoChunkDataCommentsKey, Kind::text, true},
    {"transients", "transients", nullptr, Kind::transients},
};

/// Labels work as names: case and the characters between words are ignored.
bool isSameName(std::string_view a, std::string_view b)
{
    const auto letters = [](std::string_view name) {
        std::string kept;
        std::ranges::copy_if(name, std::back_inserter(kept), [](char c) { return c != '-' && c != ' ' && c != '_'; });
        return kept;
    };
    return equalIgnoringASCIICase(letters(a), letters(b));
}

} // namespace

std::span<const LoopTagField> loopTagFields()
{
    return kFields;
}

std::vector<const LoopTagField*> loopTagFieldsForKey(std::string_view key)
{
    std::vector<std::string_view> names{key};
    if (isSameName(key, "key"))
        names = {"midiRootNote", "keyType"};
    else if (isSameName(key, "mode"))
        names = {"keyType"};
    else if (isSameName(key, "signature"))
        names = {"signatureTop", "signatureBottom"};
    std::vector<const LoopTagField*> fields;
    for (const LoopTagField& field : kFields)
        if (std::ranges::any_of(names, [&](std::string_view name) {
                return isSameName(name, field.name) || isSameName(name, field.word);
            }))
            fields.push_back(&field);
    return fields;
}

std::string loopKeyName(std::int64_t note)
{
    constexpr std::int64_t octave = 12, lowestNamed = 48;
    return note < 1 || note > 127 ? "" : std::string(VireoLoopNoteName(lowestNamed + note % octave));
}

std::string carriedLoopChunkName(const VireoLoopBaseChunk& chunk)
{
    return chunk.aifChunkID() != 0 ? fourCCText(chunk.aifChunkID()) : "silence";
}
