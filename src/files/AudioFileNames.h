// The names of audio files: extensions, and suffixes of the two halves of a stereo pair; cut, set and compared. Case
// means ASCII case. C strings are changed in place; a null one is left alone.
#pragma once

#include "files/AudioFileTypes.h"

/// The flags of CFileUtilHasStereoExtension, a bit set.
enum : int {
    kStereoCut = 1,      // cut the suffix from the name
    kStereoPosition = 2, // return where the suffix begins instead of its index
    kStereoOrPlain = 4,  // when there is none, cut a plain audio extension and return -2
};

/// The stereo index of the name's suffix: twice its row in the audio file type table, plus one for a right half. -1
/// when it has none.
KT_EXPORT int CFileUtilHasStereoExtension(char* name, int flags);
/// The same without cutting anything. Only the first 255 bytes of the name count.
KT_EXPORT int CFileUtilHasStereoExtension(const char* name);
/// Where the suffix begins in the first 255 bytes of the name, or -1.
KT_EXPORT int CFileUtilGetPointExt(const char* name);
/// The suffix of a stereo index, copied to `out` (7 bytes at most), which is returned; the table's own text when
/// `out` is null. For an index out of range the result is null, and `out` empty.
KT_EXPORT char* CFileUtilGetStereoExtension(char* out, int index);
/// Sets `partner` (may be null) to the other half of a stereo pair, which need not exist. False, and `partner`
/// unchanged, for a name without a suffix and a path of 1,024 bytes and more.
KT_EXPORT bool CFileUtilGetStereoPartner(const CFileRef& file, CFileRef* partner);

/// Cuts audio extensions and stereo suffixes until none is left; true when it cut one. A name that consists of
/// nothing else keeps its last one.
KT_EXPORT bool CFileUtilCutKnownAudioFileExtension(char* name);
/// The same for a reference's name; if its URL has no base, for its path (1,023 bytes at most).
KT_EXPORT bool CFileUtilCutKnownAudioFileExtension(CFileRef* file);
/// Whether cutting would change the name.
KT_EXPORT bool CFileUtilHasKnownAudioFileExtension(const CFileRef& file);

// Extensions may be given with their dot or without. `size` is the capacity of the name in bytes, its NUL included:
// a name without room for the extension is shortened, and an extension without room is cut.

/// Unless the name ends with the extension in any case, cuts known audio extensions, appends it, and returns true.
KT_EXPORT bool CFileUtilEnsureExtension(char* name, const char* ext, int size);
/// The same for the name of a reference; false also when the new name is too long.
KT_EXPORT bool CFileUtilEnsureExtension(CFileRef* file, const char* ext);
/// Unless the name ends with exactly `ext`, cuts known audio extensions and appends it. Kept: unlike the function
/// above, it compares case, and needs no dot ahead when `ext` has none.
KT_EXPORT void CFileUtilSetExtension(char* name, const char* ext, int size);
/// The same for the name of a reference.
KT_EXPORT void CFileUtilSetExtension(CFileRef* file, const char* ext);
/// Appends the extension and cuts nothing; does nothing for a null or empty one.
KT_EXPORT void CFileUtilSetNewExtension(char* name, const char* ext, int size);
/// Cuts `ext` from the end of the name, in any case, when the name is longer. With a null `ext`, cuts everything from
/// the last dot on, unless that is empty, a number (of a take), or 7 bytes or longer; ".aupreset" is cut
/// nevertheless. True when something was cut.
KT_EXPORT bool CFileUtilCutExtension(char* name, const char* ext);
