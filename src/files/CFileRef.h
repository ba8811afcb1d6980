// CFileRef names a file or folder; the rest of the library takes it wherever a location is needed. A value: it owns a
// share of one immutable file URL, which holds the path, and caches the item's handle. It never opens the file.
#pragma once

#include "platform/Bookmark.h"
#include "platform/FileSystem.h"
#include "platform/String.h"
#include "platform/TextEncoding.h"
#include "platform/URL.h"
#include "platform/core/Value.h"

#include <cstdint>
#include <memory>
#include <optional>
#include <string>

/// How a path is written.
enum tPathStyle : int {
    kPOSIXPathStyle = 0, // a leading "~" is expanded
    kColonPathStyle = 1, // enters only through SetFromColonPath
    kWindowsPathStyle = 2,
};

/// What CreatePList stores, a bit set: 0 and 2 only the URL string, 1 only a bookmark (the URL string if none can be
/// made), 3 both.
enum tCFileRefPListCreationType : unsigned int {
    kCFileRefPListBookmark = 1,
    kCFileRefPListURL = 2,
};

/// The name of an item in UTF-16, as catalogs keep it.
struct UnicodeName {
    std::uint16_t length = 0;   // in UTF-16 units
    char16_t unicode[255] = {}; // not terminated
};

/// A file or folder by name. Every setter, and every operation that builds on the path, first resets the reference: a
/// failed one leaves it invalid, never with its old value. Booleans report success. Texts taken as `const char*` are
/// UTF-8. Several threads may read a reference while none changes it; copies are independent.
class KT_EXPORT CFileRef {
public:
    static const CFileRef None;                   // what queries return that find nothing
    static platform::TextEncoding mLocalEncoding; // tried first by SetFromColonPath; set it once, at start-up

    CFileRef() = default;
    /// As Set(path, isDirectory).
    CFileRef(const char* path, bool isDirectory);
    /// As Set(path, style, isDirectory).
    CFileRef(const platform::String& path, tPathStyle style, bool isDirectory);
    /// As Set(folder, name).
    CFileRef(const platform::String& folder, const platform::String& name);
    /// As Set(url).
    explicit CFileRef(platform::URLRef url);
    /// Not there: a second pointer would pass for `isDirectory`. A folder and a name are platform strings.
    template <class T>
    CFileRef(const char* folder, const T* name) = delete;
    /// Shares the URL; the cached handle is not copied.
    CFileRef(const CFileRef& other);
    CFileRef& operator=(const CFileRef& other);
    ~CFileRef();

    /// Each resets to the state of a new object: invalid.
    void Init() { ReInit(); }
    void ReInit();
    void Invalidate() { ReInit(); }

    /// Takes a path in the file system's form; "~" and "~user" at its start are expanded.
    bool Set(const char* path, bool isDirectory);
    /// Takes a path in a style. Colon style fails: such paths enter only through SetFromColonPath.
    bool Set(const platform::String& path, tPathStyle style, bool isDirectory);
    /// Takes the file `name` in `folder`; with a null name, the folder itself.
    bool Set(const platform::String& folder, const platform::String& name);
    /// Not there, as the constructor.
    template <class T>
    bool Set(const char* folder, const T* name) = delete;
    /// Takes the URL as it is.
    bool Set(platform::URLRef url);
    /// Takes the path of the URL, as a directory or not.
    bool Set(const platform::URLRef& url, bool isDirectory);
    /// Takes the path of another reference, as a directory or not.
    bool Set(const CFileRef& other, bool isDirectory);
    /// Takes the item of a handle; fails when it is not found any more.
    bool Set(const platform::FileHandle* handle);
    /// Takes "Volume:folder:file", decoded by `mLocalEncoding`, else by the system's encoding, else as 16-bit
    /// Unicode.
    bool SetFromColonPath(const char* path, bool isDirectory);
    /// Takes the text of a file URL.
    bool SetFromURLString(const std::string& url);
    /// Takes a dictionary that CreatePList made: the item that its bookmark finds, else the path in the bookmark, else
    /// the URL.
    bool SetFromPList(const platform::Value* plist, bool allowUserInteraction);
    /// Takes the bytes that CreateBinaryPList made.
    bool SetFromBinaryPList(BytesView data, bool allowUserInteraction);

    /// Each appends components, which slashes separate.
    bool AddToPath(const char* component, bool isDirectory);
    bool AddToPath(const platform::String& component, bool isDirectory);
    /// Appends the last component of another reference; fails when either is invalid.
    bool AddToPath(const CFileRef& other);
    /// Removes the last component; the result is a directory.
    bool SetToParent();
    /// Each replaces the last component.
    bool ReplaceName(const char* name, bool isDirectory);
    bool ReplaceName(const platform::String& name, bool isDirectory);
    /// Replaces the last component with that of another reference.
    bool ReplaceName(const CFileRef& other);
    /// Replaces the extension, given with or without its dot; an empty one removes it. The result denotes a file.
    /// Fails when the new name has 1,024 bytes or more.
    bool ReplaceExtensionBy(const std::string& ext);

    /// Whether the reference names something; the item need not exist.
    bool IsValid() const { return valid_; }
    /// The URL; null when invalid.
    const platform::URLRef& URL() const { return url_; }

    /// The path without trailing slashes, owned by the URL: valid until the reference changes. Null when there is
    /// none, as for a relative URL and one of another host or scheme.
    const char* GetPath() const;
    /// Copies the path. True only when all of it fits; `buffer` is made empty first.
    bool GetPath(char* buffer, unsigned int size) const;
    /// GetPath(); null when there is none.
    operator const char*() const { return GetPath(); }
    /// The path; empty when there is none.
    operator std::string() const;
    /// The path in the POSIX form for style 0, in the Windows form for every other value, kColonPathStyle included.
    platform::String CopyFileSystemPath(tPathStyle style) const;

    /// The last component; null when invalid.
    platform::String CopyFileName() const;
    /// Copies the last component; false when it does not fit in `size` bytes with its NUL.
    bool GetFileName(char* buffer, long size) const;
    /// Copies the last component, or the name that the cached handle has now; false for more than 255 UTF-16 units.
    bool UnicodeFileName(UnicodeName* name) const;
    /// Whether the name fits in 1,024 bytes, its terminator included.
    bool HasValidName() const;
    /// The extension without its dot; false, and `extension` unchanged, for none.
    bool GetExtension(std::string& extension) const;
    /// Copies the extension without its dot; false when there is none or it does not fit.
    bool GetExtension(char* buffer, unsigned long size) const;
    /// The extension without its dot; null for none.
    platform::String CopyFileExtension() const;
    /// Whether the extension is `ext`, without regard to ASCII case; `ext` may have a leading dot.
    bool HasExtension(const std::string& ext) const;
    /// The name that a desktop shows; for an item that does not exist the last component.
    platform::String GetDisplayName() const;
    /// The same as GetDisplayName().
    platform::String CopyDisplayName() const;

    /// An opaque value, equal for items on one volume; null on failure.
    std::shared_ptr<const Bytes> GetVolumeID() const;
    /// The folder on which the item's volume is mounted; invalid on failure.
    CFileRef GetMountPoint() const;

    /// Whether the item is the top of its volume: "/", or where a volume is mounted.
    bool IsRoot() const;
    /// Whether something is there, links followed.
    bool Exists() const;
    /// Whether a file is there, links followed.
    bool IsFile() const;
    /// Whether a folder is there, links followed.
    bool IsFolder() const;
    /// Whether a folder is there that is shown as one document.
    bool IsExistingPackage() const;
    /// Whether the process may write to the item.
    bool IsWritable() const;
    /// Whether `other` is this or lies inside it, without regard to ASCII case.
    bool PathContains(const CFileRef& other) const;

    /// Replaces an alias file or a symbolic link with its target; true only when the reference changed.
    bool ResolveAlias(bool allowUserInteraction);
    /// Makes the handle of the item; false when the item does not exist.
    bool GetFSRef(platform::FileHandle* handle) const;
    /// Makes the handle of the item and caches it; false when the item does not exist.
    bool UpdateInternalFSRef();

    /// A dictionary for SetFromPList; null when nothing could be stored.
    std::optional<platform::Dictionary> CreatePList(tCFileRefPListCreationType type) const;
    /// The same as bytes, for SetFromBinaryPList.
    std::optional<Bytes> CreateBinaryPList(tCFileRefPListCreationType type) const;

    /// References compare by the path with symbolic links resolved; invalid ones are equal to each other and come
    /// last. All six operators exist, since a missing one would compare the pointers of `operator const char*`.
    friend KT_EXPORT bool operator==(const CFileRef& a, const CFileRef& b);
    friend KT_EXPORT bool operator<(const CFileRef& a, const CFileRef& b);
    friend bool operator>(const CFileRef& a, const CFileRef& b) { return b < a; }
    friend bool operator<=(const CFileRef& a, const CFileRef& b) { return !(b < a); }
    friend bool operator>=(const CFileRef& a, const CFileRef& b) { return !(a < b); }
    /// A hash that is equal for equal references.
    std::size_t hash() const;

    /// Writes the path and whether it exists to standard output.
    void Trace() const;

private:
    bool SetTildePath(const platform::String& path, bool isDirectory);

    platform::URLRef url_;
    bool valid_ = false;
    std::unique_ptr<platform::FileHandle> fileHandle_; // cache of UpdateInternalFSRef; null is all zero
};
