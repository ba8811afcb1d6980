// Where a file lies: its volume and the space on it, and the folders that mean something to the desktop.
#pragma once

#include "files/CFileRef.h"

// Booleans are false when the item cannot be examined.

/// Whether the item's volume is read-only.
KT_EXPORT bool CFileUtilIsReadOnlyVolume(const CFileRef& item);
/// Whether the volume keeps its files on another machine.
KT_EXPORT bool CFileUtilIsNetworkDrive(const CFileRef& item);
/// Whether both items lie on one mounted volume.
KT_EXPORT bool CFileUtilItemsOnSameVolume(const CFileRef& a, const CFileRef& b);
/// The free bytes on the volume of the item, or of the nearest existing folder above it; `totalSize` (may be null)
/// gets the size of the volume. Both are 0 on failure.
KT_EXPORT long long CFileUtilFreeDiskSpaceAtPath(const CFileRef& item, long long* totalSize);

/// Whether the item lies in a trash folder: that of the user's home, or the user's on another volume.
KT_EXPORT bool CFileUtilIsInTrash(const CFileRef& item);
/// Whether a folder above has a name that begins with a dot, judged by the path alone; or whether the desktop hides
/// the item or a folder above it on its volume.
KT_EXPORT bool CFileUtilIsHiddenOrInHiddenFolder(const CFileRef& item);
/// Judged by the beginning of the path alone.
KT_EXPORT bool CFileUtilIsPathFromMobileDevice(const CFileRef& item);
/// Whether the item lies in the folder of this process's application.
KT_EXPORT bool CFileUtilIsInAppBundle(const CFileRef& item);
/// Whether the item, its links resolved, lies in "Mobile Documents" of a Library folder.
KT_EXPORT bool CFileUtilIsInCloudDocs(const CFileRef& item);
/// Whether the item, which must exist, is installed content: in a "Library.bundle", in the suite's folder of content,
/// or in the suite's "Application Support" of a Library folder.
KT_EXPORT bool CFileUtilIsInLibraryFolder(const CFileRef& item);
