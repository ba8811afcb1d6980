// The keys of a package's two property lists, and the kinds of media that an alternative lists.
#pragma once

#include "platform/core/Export.h"

#include <array>
#include <string_view>

/// Keys of the information dictionary, "Resources/ProjectInformation.plist".
namespace ProjectInfoKey {
inline constexpr const char* bundleVersion = "BundleVersion";       // number
inline constexpr const char* variantNames = "VariantNames";         // dictionary: index in decimal -> name
inline constexpr const char* variantNamesV2 = "VariantNamesV2";     // the same, with the project's name as a token
inline constexpr const char* activeVariant = "ActiveVariant";       // integer
inline constexpr const char* hasProjectFolder = "HasProjectFolder"; // boolean
inline constexpr const char* lastSavedFrom = "LastSavedFrom";       // text
} // namespace ProjectInfoKey

/// Keys of an alternative's metadata, "MetaData.plist".
namespace ProjectMetaDataKey {
inline constexpr const char* sampleRate = "SampleRate";                             // unsigned integer
inline constexpr const char* beatsPerMinute = "BeatsPerMinute";                     // number
inline constexpr const char* frameRateIndex = "FrameRateIndex";                     // integer
inline constexpr const char* isTimeCodeBased = "isTimeCodeBased";                   // boolean
inline constexpr const char* hasGrid = "HasGrid";                                   // boolean
inline constexpr const char* surroundFormatIndex = "SurroundFormatIndex";           // integer
inline constexpr const char* surroundModeIndex = "SurroundModeIndex";               // integer
inline constexpr const char* signatureKey = "SignatureKey";                         // integer
inline constexpr const char* songSignatureNumerator = "SongSignatureNumerator";     // integer
inline constexpr const char* songSignatureDenominator = "SongSignatureDenominator"; // integer
inline constexpr const char* numberOfTracks = "NumberOfTracks";                     // integer
inline constexpr const char* songKey = "SongKey";                                   // text
inline constexpr const char* songGenderKey = "SongGenderKey";                       // text
inline constexpr const char* version = "Version";                                   // integer
inline constexpr const char* audioFiles = "AudioFiles";                           // arrays of paths, this and the next
inline constexpr const char* impulseResponsesFiles = "ImpulsResponsesFiles";      // Kept: the spelling
inline constexpr const char* samplerInstrumentsFiles = "SamplerInstrumentsFiles"; // as above
inline constexpr const char* playbackFiles = "PlaybackFiles";                     // as above
inline constexpr const char* gestiniopFiles = "GestiniopFiles";                   // as above
inline constexpr const char* quicksamplerFiles = "QuicksamplerFiles";             // as above
inline constexpr const char* videoFiles = "VideoFiles";                           // as above
inline constexpr const char* alchemyFiles = "AlchemyFiles";                       // as above
} // namespace ProjectMetaDataKey

/// The kinds of media that an alternative lists.
enum class ProjectMediaKind {
    audio,
    impulseResponses,
    samplerInstruments,
    playback,
    gestiniop,
    quicksampler,
    video,
    alchemy2,
};

/// A row of kProjectMediaLists.
struct ProjectMediaList {
    ProjectMediaKind kind; // also its row
    const char* key;       // in the metadata
    const char* name;      // for people
};

/// The lists in the order of the kinds.
inline constexpr std::array<ProjectMediaList, 8> kProjectMediaLists{{
    {ProjectMediaKind::audio, ProjectMetaDataKey::audioFiles, "audio"},
    {ProjectMediaKind::impulseResponses, ProjectMetaDataKey::impulseResponsesFiles, "impulse responses"},
    {ProjectMediaKind::samplerInstruments, ProjectMetaDataKey::samplerInstrumentsFiles, "sampler instruments"},
    {ProjectMediaKind::playback, ProjectMetaDataKey::playbackFiles, "playback"},
    {ProjectMediaKind::gestiniop, ProjectMetaDataKey::gestiniopFiles, "gestiniop"},
    {ProjectMediaKind::quicksampler, ProjectMetaDataKey::quicksamplerFiles, "quick sampler"},
    {ProjectMediaKind::video, ProjectMetaDataKey::videoFiles, "video"},
    {ProjectMediaKind::alchemy2, ProjectMetaDataKey::alchemyFiles, "alchemy"},
}};
static_assert([] {
    for (std::size_t i = 0; i < kProjectMediaLists.size(); ++i)
        if (kProjectMediaLists[i].kind != static_cast<ProjectMediaKind>(i))
            return false;
    return true;
}());
