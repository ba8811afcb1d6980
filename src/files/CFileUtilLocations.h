// Where a file lies: its volume and the space there, and the folders that mean something to the desktop.
#pragma once

#include "files/CFileRef.h"

// Booleans are false for an item of which nothing can be learnt.

KT_EXPORT bool CFileUtilIsReadOnlyVolume(const CFileRef& item);
/// Whether the volume's files are on another machine.
KT_EXPORT bool CFileUtilIsNetworkDrive(const CFileRef& item);
KT_EXPORT bool CFileUtilItemsOnSameVolume(const CFileRef& a, const CFileRef& b);
/// The free bytes of the volume of the item, or of the nearest folder above it that exists; `totalSize` (may be null)
/// receives the volume's size. Both 0 when they cannot be had.
KT_EXPORT long long CFileUtilFreeDiskSpaceAtPath(const CFileRef& item, long long* totalSize);

/// Whether the item lies in a trash folder: that of the user's home, or the user's on another volume.
KT_EXPORT bool CFileUtilIsInTrash(const CFileRef& item);
/// Whether a folder above begins with a dot, by the path alone; or whether the desktop shows neither the item nor one
/// of the folders above it on its volume.
KT_EXPORT bool CFileUtilIsHiddenOrInHiddenFolder(const CFileRef& item);
/// By the beginning of the path alone.
KT_EXPORT bool CFileUtilIsPathFromMobileDevice(const CFileRef& item);
KT_EXPORT bool CFileUtilIsInAppBundle(const CFileRef& item);
/// Whether the item, its links resolved, lies in "Mobile Documents" of a Library folder.
KT_EXPORT bool CFileUtilIsInCloudDocs(const CFileRef& item);
/// Whether the item, which must exist, is installed content: in a "Library.bundle", in the suite's folder of content,
/// or in the suite's "Application Support" of a Library folder.
KT_EXPORT bool CFileUtilIsInLibraryFolder(const CFileRef& item);
