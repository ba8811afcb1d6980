// ProjectInformation reads what a project package says about itself without opening the project: its alternatives, the
// metadata and the media of each, and its backups. It knows the package's layout and writes the information dictionary
// back. docs/formats/project-package.md has the format.
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

/// The domain of errors that are the project layer's own; the text says what is wrong.
inline constexpr const char* kProjectErrorDomain = "KTFiles";

enum class CreateDirectories : bool { no, yes };
enum class AcceptMissing : bool { no, yes };
enum class PurgeOldBackups : bool { no, yes };

struct ProjectBackup {
    platform::URLRef url; // the backup's folder
    platform::Date date;  // when its project data was changed
};

/// Which backup an exchange of data that was cut short had to do with.
struct InterruptedProjectExchange {
    platform::URLRef backupURL; // null when the record of the exchange cannot be understood
    bool isComplete = false;    // nothing is left to do but to forget it
};

/// What is to become of an exchange that was cut short: brought to its end, or back; or left as it stands, all data
/// where it is, and its record dropped.
enum class SettleExchange { complete, undo, forget };

/// Owns the dictionaries that it has read; whoever changes a package makes a new object. URLs are taken by reference
/// and may be null, which gives null. Nothing is believed of a property list: a value of another shape than its key's
/// reads as absent. Used by one thread at a time.
class KT_EXPORT ProjectInformation {
public:
    /// `initWithProjectURL:`; null when the package's information dictionary cannot be read.
    static std::unique_ptr<ProjectInformation> initWithProjectURL(const platform::URLRef& projectURL);

    const platform::URLRef& projectURL() const { return projectURL_; }
    /// As read, with both forms of the names.
    const platform::Dictionary& projectInfo() const { return projectInfo_; }

    /// Index in decimal -> name; empty without names.
    platform::Dictionary alternativeNames() const;
    /// The keys of the names: by number, then what is no number, by its bytes.
    std::vector<std::string> variationIndexesSorted() const;
    std::optional<std::string> variationNameForIndex(long index) const;
    long lastActiveVariation() const;
    bool hasProjectFolder() const;

    /// The alternative's metadata, null when there is none; kept from the first success on. The pointer lives as long
    /// as this object.
    const platform::Dictionary* loadMetaDataForVariant(long index);

    // Of one alternative's metadata; 0, false or null when absent. A negative index means `lastActiveVariation`.
    std::uint64_t sampleRate(long index);
    double beatsPerMinute(long index);
    std::int64_t frameRateIndex(long index);
    bool isTimeCodeBased(long index);
    bool hasGrid(long index);
    std::int64_t surroundFormatIndex(long index);
    std::int64_t surroundModeIndex(long index);
    std::int64_t signKey(long index);
    std::int64_t timeSignatureNumerator(long index);
    std::int64_t timeSignatureDenominator(long index);
    std::int64_t numberOfTracks(long index);
    std::optional<std::string> songKeyAsNonLocalizedString(long index);
    std::optional<std::string> songGenderAsNonLocalizedString(long index);
    std::int64_t metaDataVersionOfVariant(long index);
    /// The largest of all alternatives; 0 without any.
    std::int64_t maxMetaDataVersionOfAnyVariant();

    // The media that alternatives use: paths as they are stored, and made absolute. Elements of a list that are no
    // texts, and paths that can name no file, are left out.
    std::vector<std::string> relativeFilepathsUsedByVariantIndex(ProjectMediaKind kind, long index);
    ProjectFileSet filesUsedByVariantIndex(ProjectMediaKind kind, long index);
    ProjectFileSet filesUsedByAnyVariant(ProjectMediaKind kind);
    ProjectFileSet allUsedFilesByVariantIndex(long index);
    ProjectFileSet allUsedFilesByAnyVariant();

    // The same by kind.
    using Kind = ProjectMediaKind;
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

    /// `pathForVariant:acceptMissing:`, of this project.
    std::optional<std::string> pathForVariant(long index, AcceptMissing acceptMissing) const;
    platform::URLRef URLForVariant(long index, AcceptMissing acceptMissing) const;

    // Names. The display name is that of the desktop, without the extension of a package.
    static std::optional<std::string> projectDisplayNameWithoutExtension(const platform::URLRef& location);
    /// `convertNamesToTokenBased:forProjectAtURL:`: every occurrence of the display name becomes "{PROJECT_NAME}".
    static platform::Dictionary convertNamesToTokenBased(const platform::Dictionary& names,
                                                         const platform::URLRef& projectURL);
    static platform::Dictionary convertNamesFromTokenBased(const platform::Dictionary& names,
                                                           const platform::URLRef& projectURL);

    // The information dictionary.
    /// As it is in the file; null for what is no property list of a dictionary.
    static std::optional<platform::Dictionary>
    infoDictionaryWithContentsOfURL(const platform::URLRef& url,
                                    platform::PropertyListReading reading = platform::PropertyListReading::strict);
    /// Of a package, with both forms of the names; a package that got a new name shows names that follow it.
    static std::optional<platform::Dictionary>
    infoDictionaryFromProjectBundleURL(const platform::URLRef& bundleURL,
                                       platform::PropertyListReading reading = platform::PropertyListReading::strict);
    /// Stamps the version of the layout and the application that saves.
    static void addVersionAndAppInfoToInfoDictionary(platform::Dictionary& info);
    /// What `writeInfoDictionaryToProjectBundleURL` writes: a copy, stamped, with the names in token form.
    static platform::Dictionary infoDictionaryForProjectBundleURL(const platform::Dictionary& info,
                                                                  const platform::URLRef& bundleURL);
    /// `writeInfoDictionary:toURL:error:`: as it is, as a binary property list, into the file itself.
    static bool writeInfoDictionaryToURL(const platform::Dictionary& info, const platform::URLRef& url,
                                         platform::Error* error = nullptr);
    /// `writeInfoDictionary:toProjectBundleURL:error:`; creates "Resources".
    static bool writeInfoDictionaryToProjectBundleURL(const platform::Dictionary& info,
                                                      const platform::URLRef& bundleURL,
                                                      platform::Error* error = nullptr);

    // Where things lie in a package. With CreateDirectories::yes the folders around a file are created, of a folder
    // itself too; null when that fails, and for an index outside 0 to 4294967295.
    /// The alternative's folder, of the newest of three generations that exists.
    static std::optional<std::string> pathForVariant(long index, const platform::URLRef& baseURL,
                                                     AcceptMissing acceptMissing);
    static platform::URLRef URLForVariant(long index, const platform::URLRef& baseURL, AcceptMissing acceptMissing);
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
    /// Of the alternative's project data; null when there is none.
    static std::optional<platform::Date> modificationDateForVariantIndex(long variantIndex,
                                                                         const platform::URLRef& bundleURL);

    // Backups of an alternative.
    /// Those that hold project data, by date, then by name; hidden folders are none.
    static std::vector<ProjectBackup> backupsForBundleURL(const platform::URLRef& bundleURL, long variantIndex);
    /// Where the next backup goes: a name of two digits, below `maxBackups`, that nothing has. With
    /// PurgeOldBackups::yes the oldest backups are deleted first, as many as are too many; when there is no name
    /// nothing is. Null when there is no room, and for a folder of backups that lies behind a link in the package.
    static platform::URLRef urlForNewBackupForBundleURL(const platform::URLRef& bundleURL, long variantIndex,
                                                        CreateDirectories create, int maxBackups,
                                                        PurgeOldBackups purgeOldBackups);
    /// Deletes the oldest backups until `maxBackups` are left, `kept` among them. Of the others the folder that was
    /// changed last goes last. False, with errno, when one cannot be deleted.
    static bool purgeBackupsForBundleURL(const platform::URLRef& bundleURL, long variantIndex, int maxBackups,
                                         const platform::URLRef& kept = nullptr);
    /// The alternative's project data changes places with the backup's, each with its metadata, ARA data and autosave;
    /// the same call once more undoes it. Nothing is copied, and nothing ever replaces anything: cut short at any
    /// point, every item is at one of the two places, and a record in the alternative's folder says what was going on.
    /// False with `error` means that nothing has changed or, where even that could not be had (the text says so), that
    /// the record is still there.
    ///
    /// The next call settles what it finds recorded, and says so in the log: an exchange with the same backup is
    /// completed, and is what the call was asked for; one with another backup is undone first, unless it had come to
    /// its end. What others have replaced meanwhile stays where it is, and the call fails. So it does for a backup that
    /// is a link, or lies behind one in the package.
    static bool exchangeDataOfProjectAtURL(const platform::URLRef& bundleURL, long variantIndex,
                                           const platform::URLRef& backupURL, platform::Error* error = nullptr);
    /// What an exchange that was cut short has left to be settled; null when there is none.
    static std::optional<InterruptedProjectExchange> interruptedExchangeForBundleURL(const platform::URLRef& bundleURL,
                                                                                     long variantIndex);
    /// Settles it without another exchange. A record that names a backup by its path is followed only when `backupURL`
    /// leads there too; else that may be null. One that cannot be understood can only be forgotten.
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
