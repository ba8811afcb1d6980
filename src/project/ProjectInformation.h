// ProjectInformation reads what a project package says about itself without opening the project: its alternatives,
// the metadata and media of each, and its backups. It knows the layout of a package and writes the information
// dictionary. docs/formats/project-package.md has the format.
#pragma once

#include "platform/PropertyList.h"
#include "platform/URL.h"
#include "platform/core/Error.h"
#include "platform/core/Value.h"
#include "project/ProjectFileSet.h"
#include "project/ProjectKeys.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>
#include <vector>

/// The domain of errors of the project layer itself; the text says what is wrong.
inline constexpr const char* kProjectErrorDomain = "KTFiles";

/// Whether missing folders are created.
enum class CreateDirectories : bool { no, yes };
/// Whether a path is wanted even when nothing is there.
enum class AcceptMissing : bool { no, yes };
/// Whether the oldest backups make room.
enum class PurgeOldBackups : bool { no, yes };

/// One backup of an alternative.
struct ProjectBackup {
    platform::URLRef url; // its folder
    platform::Date date;  // when its project data last changed
};

/// An exchange of data that was interrupted.
struct InterruptedProjectExchange {
    platform::URLRef backupURL; // null when its record cannot be understood
    bool isComplete = false;    // only its record is left to be removed
};

/// What becomes of an interrupted exchange: it is completed, or undone, or its record is dropped with all data left
/// where it is.
enum class SettleExchange { complete, undo, forget };

/// One project package, read. Owns the dictionaries that it has read; after a change to the package, make a new
/// object. URLs may be null, which gives null. A value in a property list whose shape does not fit its key reads as
/// absent. One thread at a time.
class KT_EXPORT ProjectInformation {
public:
    /// `initWithProjectURL:`; null when the package's information dictionary cannot be read.
    static std::unique_ptr<ProjectInformation> initWithProjectURL(const platform::URLRef& projectURL);

    /// The package, as it was given.
    const platform::URLRef& projectURL() const { return projectURL_; }
    /// The information dictionary, with both forms of the names.
    const platform::Dictionary& projectInfo() const { return projectInfo_; }

    /// The names of the alternatives by index in decimal; empty without names.
    platform::Dictionary alternativeNames() const;
    /// The keys of the names: numbers in order, then the others by their bytes.
    std::vector<std::string> variationIndexesSorted() const;
    /// The name of an alternative; null for none.
    std::optional<std::string> variationNameForIndex(long index) const;
    /// The index of the alternative that was open last; 0 when the package does not say.
    long lastActiveVariation() const;
    /// Whether the media lie in a folder beside the package.
    bool hasProjectFolder() const;

    /// The metadata of an alternative; null when there is none. Kept from the first success on; the pointer lives as
    /// long as this object.
    const platform::Dictionary* loadMetaDataForVariant(long index);

    // One alternative's metadata; 0, false or null when absent. A negative index means lastActiveVariation().
    /// In Hz.
    std::uint64_t sampleRate(long index);
    /// The tempo.
    double beatsPerMinute(long index);
    /// A row of the application's table of frame rates.
    std::int64_t frameRateIndex(long index);
    /// The flag `isTimeCodeBased` of the metadata.
    bool isTimeCodeBased(long index);
    /// The flag `HasGrid` of the metadata.
    bool hasGrid(long index);
    /// A row of the application's table of surround formats.
    std::int64_t surroundFormatIndex(long index);
    /// A row of the application's table of surround modes.
    std::int64_t surroundModeIndex(long index);
    /// `SignatureKey`, a number of the application.
    std::int64_t signKey(long index);
    /// Beats in a bar.
    std::int64_t timeSignatureNumerator(long index);
    /// The note that is one beat: 4, 8.
    std::int64_t timeSignatureDenominator(long index);
    /// How many tracks there are.
    std::int64_t numberOfTracks(long index);
    /// The key's note ("F#"), the same in every language; null when absent.
    std::optional<std::string> songKeyAsNonLocalizedString(long index);
    /// The key's mode ("minor"), the same in every language; null when absent.
    std::optional<std::string> songGenderAsNonLocalizedString(long index);
    /// The version of the metadata's layout.
    std::int64_t metaDataVersionOfVariant(long index);
    /// The greatest of all alternatives; 0 without any.
    std::int64_t maxMetaDataVersionOfAnyVariant();

    // The media of alternatives: paths as stored, and made absolute. Elements of a list that are no texts, and paths
    // that can name no file, are left out.
    // texts, and paths that can name no file, are left out.
    /// The paths as stored, in their order.
    std::vector<std::string> relativeFilepathsUsedByVariantIndex(ProjectMediaKind kind, long index);
    /// The absolute paths of one kind.
    ProjectFileSet filesUsedByVariantIndex(ProjectMediaKind kind, long index);
    /// The absolute paths of one kind, of all alternatives.
    ProjectFileSet filesUsedByAnyVariant(ProjectMediaKind kind);
    /// The absolute paths of all kinds.
    ProjectFileSet allUsedFilesByVariantIndex(long index);
    /// The absolute paths of all kinds, of all alternatives.
    ProjectFileSet allUsedFilesByAnyVariant();

    // The same by kind.
    /// The kinds of media.
    using Kind = ProjectMediaKind;
    /// Each the files, or the paths as stored, of the kind that it names.
    ProjectFileSet audioFilesUsedByVariantIndex(long i) { return filesUsedByVariantIndex(Kind::audio, i); }
    ProjectFileSet audioFilesUsedByAnyVariant() { return filesUsedByAnyVariant(Kind::audio); }
    ProjectFileSet impulseResponsesFilesUsedByVariantIndex(long i)
    {
        return filesUsedByVariantIndex(Kind::impulseResponses, i);
    }
    ProjectFileSet impulseResponsesFilesUsedByAnyVariant() { return filesUsedByAnyVariant(Kind::impulseResponses); }
    std::vector<std::string> relativeImpulseResponsesFilepathsUsedByVariantIndex(long i)
    {
        return relativeFilepathsUsedByVariantIndex(Kind::impulseResponses, i);
    }
    ProjectFileSet samplerInstrumentsFilesUsedByVariantIndex(long i)
    {
        return filesUsedByVariantIndex(Kind::samplerInstruments, i);
    }
    ProjectFileSet samplerInstrumentsFilesUsedByAnyVariant() { return filesUsedByAnyVariant(Kind::samplerInstruments); }
    std::vector<std::string> relativeSamplerInstrumentsFilepathsUsedByVariantIndex(long i)
    {
        return relativeFilepathsUsedByVariantIndex(Kind::samplerInstruments, i);
    }
    ProjectFileSet playbackFilesUsedByVariantIndex(long i) { return filesUsedByVariantIndex(Kind::playback, i); }
    ProjectFileSet playbackFilesUsedByAnyVariant() { return filesUsedByAnyVariant(Kind::playback); }
    std::vector<std::string> relativePlaybackFilepathsUsedByVariantIndex(long i)
    {
        return relativeFilepathsUsedByVariantIndex(Kind::playback, i);
    }
    ProjectFileSet gestiniopFilesUsedByVariantIndex(long i) { return filesUsedByVariantIndex(Kind::gestiniop, i); }
    ProjectFileSet gestiniopFilesUsedByAnyVariant() { return filesUsedByAnyVariant(Kind::gestiniop); }
    std::vector<std::string> relativeGestiniopFilepathsUsedByVariantIndex(long i)
    {
        return relativeFilepathsUsedByVariantIndex(Kind::gestiniop, i);
    }
    ProjectFileSet quicksamplerFilesUsedByVariantIndex(long i)
    {
        return filesUsedByVariantIndex(Kind::quicksampler, i);
    }
    ProjectFileSet quicksamplerFilesUsedByAnyVariant() { return filesUsedByAnyVariant(Kind::quicksampler); }
    std::vector<std::string> relativeQuicksamplerFilepathsUsedByVariantIndex(long i)
    {
        return relativeFilepathsUsedByVariantIndex(Kind::quicksampler, i);
    }
    ProjectFileSet videoFilesUsedByVariantIndex(long i) { return filesUsedByVariantIndex(Kind::video, i); }
    ProjectFileSet videoFilesUsedByAnyVariant() { return filesUsedByAnyVariant(Kind::video); }
    ProjectFileSet alchemy2FilesUsedByVariantIndex(long i) { return filesUsedByVariantIndex(Kind::alchemy2, i); }
    ProjectFileSet alchemy2FilesUsedByAnyVariant() { return filesUsedByAnyVariant(Kind::alchemy2); }
    std::vector<std::string> relativeAlchemy2FilepathsUsedByVariantIndex(long i)
    {
        return relativeFilepathsUsedByVariantIndex(Kind::alchemy2, i);
    }

    /// `pathForVariant:acceptMissing:`: the folder of an alternative of this project; null when it is missing, unless
    /// that is accepted.
    std::optional<std::string> pathForVariant(long index, AcceptMissing acceptMissing) const;
    /// The same as a URL.
    platform::URLRef URLForVariant(long index, AcceptMissing acceptMissing) const;

    // Names. The display name is the desktop's, without the extension of a package.
    /// The display name of a package; null without a location.
    static std::optional<std::string> projectDisplayNameWithoutExtension(const platform::URLRef& location);
    /// `convertNamesToTokenBased:forProjectAtURL:`: replaces every occurrence of the display name with
    /// "{PROJECT_NAME}".
    static platform::Dictionary convertNamesToTokenBased(const platform::Dictionary& names,
                                                         const platform::URLRef& projectURL);
    /// `convertNamesFromTokenBased:forProjectAtURL:`: replaces every "{PROJECT_NAME}" with the display name.
    static platform::Dictionary convertNamesFromTokenBased(const platform::Dictionary& names,
                                                           const platform::URLRef& projectURL);

    // The information dictionary.
    /// The dictionary as it is in the file; null when the file is no property list of a dictionary.
    static std::optional<platform::Dictionary>
    infoDictionaryWithContentsOfURL(const platform::URLRef& url,
                                    platform::PropertyListReading reading = platform::PropertyListReading::strict);
    /// The dictionary of a package, with both forms of the names; the names follow a package that was renamed.
    static std::optional<platform::Dictionary>
    infoDictionaryFromProjectBundleURL(const platform::URLRef& bundleURL,
                                       platform::PropertyListReading reading = platform::PropertyListReading::strict);
    /// Sets the version of the layout and the application that saves.
    static void addVersionAndAppInfoToInfoDictionary(platform::Dictionary& info);
    /// A copy as `writeInfoDictionaryToProjectBundleURL` writes it, with version, application, and names in token
    /// form.
    static platform::Dictionary infoDictionaryForProjectBundleURL(const platform::Dictionary& info,
                                                                  const platform::URLRef& bundleURL);
    /// `writeInfoDictionary:toURL:error:`: writes the dictionary as it is, as a binary property list, into the file
    /// itself. False with `error`.
    static bool writeInfoDictionaryToURL(const platform::Dictionary& info, const platform::URLRef& url,
                                         platform::Error* error = nullptr);
    /// `writeInfoDictionary:toProjectBundleURL:error:`; creates "Resources". False with `error`.
    static bool writeInfoDictionaryToProjectBundleURL(const platform::Dictionary& info,
                                                      const platform::URLRef& bundleURL,
                                                      platform::Error* error = nullptr);

    // Where things lie in a package. CreateDirectories::yes creates the folders around a file, and a folder itself
    // too. Null when that fails, and for an index outside 0 to 4294967295.
    /// The alternative's folder in the newest existing of three generations; null when it is missing, unless that is
    /// accepted.
    static std::optional<std::string> pathForVariant(long index, const platform::URLRef& baseURL,
                                                     AcceptMissing acceptMissing);
    /// The same as a URL.
    static platform::URLRef URLForVariant(long index, const platform::URLRef& baseURL, AcceptMissing acceptMissing);
    /// Each the location that it names, in the package or in the folder of one alternative.
    static platform::URLRef alternativesBaseURLForBundleURL(const platform::URLRef& bundleURL,
                                                            CreateDirectories create);
    static platform::URLRef projectInformationURLForBundleURL(const platform::URLRef& bundleURL,
                                                              CreateDirectories create);
    static platform::URLRef mediaURLForBundleURL(const platform::URLRef& bundleURL, CreateDirectories create);
    static platform::URLRef variantBaseURLForBundleURL(const platform::URLRef& bundleURL, long variantIndex,
                                                       CreateDirectories create);
    static platform::URLRef metaDataURLForBundleURL(const platform::URLRef& bundleURL, long variantIndex,
                                                    CreateDirectories create);
    static platform::URLRef windowImageURLForBundleURL(const platform::URLRef& bundleURL, long variantIndex,
                                                       CreateDirectories create);
    static platform::URLRef oldDisplayStateURLForBundleURL(const platform::URLRef& bundleURL, long variantIndex,
                                                           CreateDirectories create);
    static platform::URLRef displayStateArchiveURLForBundleURL(const platform::URLRef& bundleURL, long variantIndex,
                                                               CreateDirectories create);
    static platform::URLRef displayStateMobileURLForBundleURL(const platform::URLRef& bundleURL, long variantIndex,
                                                              CreateDirectories create);
    static platform::URLRef projectDataURLForBundleURL(const platform::URLRef& bundleURL, long variantIndex,
                                                       CreateDirectories create);
    static platform::URLRef ARAFilesURLForBundleURL(const platform::URLRef& bundleURL, long variantIndex,
                                                    CreateDirectories create);
    static platform::URLRef backupsBaseURLForBundleURL(const platform::URLRef& bundleURL, long variantIndex,
                                                       CreateDirectories create);
    /// When the alternative's project data last changed; null when it has none.
    static std::optional<platform::Date> modificationDateForVariantIndex(long variantIndex,
                                                                         const platform::URLRef& bundleURL);

    // Backups of an alternative.
    /// The backups with project data, by date, then by name; hidden folders do not count.
    static std::vector<ProjectBackup> backupsForBundleURL(const platform::URLRef& bundleURL, long variantIndex);
    /// The folder of the next backup: a free name of two digits below `maxBackups`. PurgeOldBackups::yes first
    /// deletes the oldest backups beyond the limit; without a free name it deletes nothing. Null when there is no
    /// room, and for a folder of backups behind a link in the package.
    static platform::URLRef urlForNewBackupForBundleURL(const platform::URLRef& bundleURL, long variantIndex,
                                                        CreateDirectories create, int maxBackups,
                                                        PurgeOldBackups purgeOldBackups);
    /// Deletes the oldest backups until `maxBackups` are left, `kept` among them; the folder that changed last goes
    /// last. False, with errno, when one cannot be deleted.
    static bool purgeBackupsForBundleURL(const platform::URLRef& bundleURL, long variantIndex, int maxBackups,
                                         const platform::URLRef& kept = nullptr);
    /// Exchanges the alternative's project data with the backup's, each with its metadata, ARA data and autosave; the
    /// same call again undoes it. Nothing is copied and nothing is replaced: after an interruption at any point,
    /// every item is at one of the two places, and a record in the alternative's folder says what was going on. False
    /// with `error`: nothing has changed or, where undoing failed too (the text says so), the record is still there.
    ///
    /// The next call settles a recorded exchange, and logs it. One with the same backup is completed, and that is all
    /// the call does; one with another backup is undone first, unless it is complete. Items that others have replaced
    /// stay where they are, and the call fails. It also fails for a backup that is a link, or lies behind one in the
    /// package.
    static bool exchangeDataOfProjectAtURL(const platform::URLRef& bundleURL, long variantIndex,
                                           const platform::URLRef& backupURL, platform::Error* error = nullptr);
    /// The interrupted exchange of an alternative; null when there is none.
    static std::optional<InterruptedProjectExchange> interruptedExchangeForBundleURL(const platform::URLRef& bundleURL,
                                                                                     long variantIndex);
    /// Settles it without another exchange. A record that names a backup by its path counts only when `backupURL`
    /// leads there too; for others that may be null. A record that cannot be understood can only be forgotten.
    static bool settleInterruptedExchangeForBundleURL(const platform::URLRef& bundleURL, long variantIndex,
                                                      SettleExchange how, const platform::URLRef& backupURL = nullptr,
                                                      platform::Error* error = nullptr);

private:
    ProjectInformation(platform::URLRef projectURL, platform::Dictionary projectInfo);

    std::vector<long> variantIndexes() const;
    const platform::Value* metaData(long index, const char* key);
    void addFiles(ProjectFileSet& files, ProjectMediaKind kind, long index);

    platform::URLRef projectURL_;
    platform::Dictionary projectInfo_;
    platform::Dictionary metaDataPerVariant_; // index in decimal -> metadata
};
