// Where the media and working folders of a project lie, whatever kind of project it is, and which package contains a
// location.
#pragma once

#include "files/CFileRef.h"

/// The kind of a project by its extension, without regard to case.
enum ProjectDirectoryType : int {
    kProjectDirectoryPackage = 0,        // "fuguex"
    kProjectDirectoryPlain = 1,          // any other extension
    kProjectDirectoryOldBand = 2,        // "band", a package without "Alternatives"
    kProjectDirectoryBand = 3,           // "band" with them, or one that does not exist
    kProjectDirectoryMwand = 4,          // "mwand"
    kProjectDirectoryGrid = 5,           // "grid"
    kProjectDirectoryConcertProject = 6, // "concert" with an entry "isProject"
    kProjectDirectoryConcert = 7,        // "concert" without that entry
};

/// Where a project keeps its media.
enum fugueXProjectType_t : int {
    kProjectTypeFromProject = 0,   // as the project itself says
    kProjectTypeMediaInside = 1,   // media inside the package
    kProjectTypeProjectFolder = 2, // media beside the package, in the folder that contains it
};

/// The folder that is asked for; docs/formats/project-package.md has their names. 0, 16 and 17 have no folder.
enum TTypeDir_Prj : int {
    kDirPrjPreviews = 1,
    kDirPrjImpulseResponses = 2,
    kDirPrjGestiniopSamples = 3,
    kDirPrjBounces = 4,
    kDirPrjSamplerInstruments = 5,
    kDirPrjSamples = 6,
    kDirPrjAudioFiles = 7,
    kDirPrjPlayback = 8,
    kDirPrjReCycleAudio = 9,
    kDirPrjUndoData = 10,
    kDirPrjMovieFiles = 11,
    kDirPrjFadeFiles = 12,
    kDirPrjFreezeFiles = 13,
    kDirPrjMedia = 14,
    kDirPrjARAFiles = 15,
    kDirPrjAlchemySamples = 18,
    kDirPrjQuickSampler = 19,
};

/// The kind of the project at a location; asks the file system only for "band" and "concert".
KT_EXPORT ProjectDirectoryType GetProjectDirectoryType(const CFileRef& project);

/// The folder of the project `base`; `create` makes it and the base where they are missing. `alternativeIndex`
/// matters only for folders inside an alternative. Invalid for a kind of project without such a folder, for numbers
/// outside the tables, and when a folder cannot be created.
KT_EXPORT CFileRef GetProjectDirectoryRefForBase(const CFileRef& base, TTypeDir_Prj type, bool create,
                                                 fugueXProjectType_t layout, long alternativeIndex);

/// The layout that a project keeps to, which kProjectTypeFromProject stands for.
KT_EXPORT fugueXProjectType_t GetProjectLayout(const CFileRef& base);

/// The location itself if it is a package, else the nearest package around it: a folder with the extension of one of
/// the suite's packages. Judged by the text of the path, links not resolved; null when there is none.
KT_EXPORT platform::URLRef GetProjectBundleURL(const platform::URLRef& location);
/// The same for a reference; invalid when there is none.
KT_EXPORT CFileRef CFileUtilEnclosingProjectBundle(const CFileRef& item);
/// Whether the item, which need not exist, lies in a package. A package does not lie in itself.
KT_EXPORT bool CFileUtilIsInDocumentBundle(const CFileRef& item);
