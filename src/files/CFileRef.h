// CFileRef names a file or folder: the value type by which everything else in the library is told where. It owns a
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

enum tPathStyle : int {
    kPOSIXPathStyle = 0, // a leading "~" is expanded
    kColonPathStyle = 1, // enters only through SetFromColonPath
    kWindowsPathStyle = 2,
};

/// A bit set: 0 and 2 store only the URL string, 1 only a bookmark (the URL string if none can be made), 3 both.
enum tCFileRefPListCreationType : unsigned int {
    kCFileRefPListBookmark = 1,
    kCFileRefPListURL = 2,
};

/// The name of an item in UTF-16, as catalogs keep it.
struct UnicodeName {
    std::uint16_t length = 0;
    char16_t unicode[255] = {};
};

/// Every setter, and every operation that builds on the path, first resets the reference, so that a failed one leaves
/// it invalid and never with its old value. Booleans report success. Texts taken as `const char*` are UTF-8. A
/// reference may be read by several threads while none changes it; copies are independent.
class KT_EXPORT CFileRef {
public:
    static const CFileRef None;                   // the answer of queries that have none
    static platform::TextEncoding mLocalEncoding; // tried first by SetFromColonPath; set once, at start-up

    CFileRef() = default;
    CFileRef(const char* path, bool isDirectory);
    CFileRef(const platform::String& path, tPathStyle style, bool isDirectory);
    CFileRef(const platform::String& folder, const platform::String& name);
    explicit CFileRef(platform::URLRef url);
    /// A folder and a name are platform strings: a second pointer would pass for `isDirectory`.
    template <class T>
    CFileRef(const char* folder, const T* name) = delete;
    /// Copies share the URL; the handle stays behind.
    CFileRef(const CFileRef& other);
    CFileRef& operator=(const CFileRef& other);
    ~CFileRef();

    /// The state of a new object.
    void Init() { ReInit(); }
    void ReInit();
    void Invalidate() { ReInit(); }

    /// A path in the file system's form; "~" and "~user" at its start are expanded.
    bool Set(const char* path, bool isDirectory);
    /// Colon style fails: such paths enter only through SetFromColonPath.
    bool Set(const platform::String& path, tPathStyle style, bool isDirectory);
    /// `name` in `folder`, a file; without a name the folder itself.
    bool Set(const platform::String& folder, const platform::String& name);
    template <class T>
    bool Set(const char* folder, const T* name) = delete;
    /// The URL as it is.
    bool Set(platform::URLRef url);
    /// The path of the URL, as a directory or not.
    bool Set(const platform::URLRef& url, bool isDirectory);
    bool Set(const CFileRef& other, bool isDirectory);
    bool Set(const platform::FileHandle* handle);
    /// "Volume:folder:file", in `mLocalEncoding`, else in the system's encoding, else in 16-bit Unicode.
    bool SetFromColonPath(const char* path, bool isDirectory);
    bool SetFromURLString(const std::string& url);
    /// From what CreatePList made.
    bool SetFromPList(const platform::Value* plist, bool allowUserInteraction);
    bool SetFromBinaryPList(BytesView data, bool allowUserInteraction);

    bool AddToPath(const char* component, bool isDirectory);
    bool AddToPath(const platform::String& component, bool isDirectory);
    bool AddToPath(const CFileRef& other);
    bool SetToParent();
    bool ReplaceName(const char* name, bool isDirectory);
    bool ReplaceName(const platform::String& name, bool isDirectory);
    bool ReplaceName(const CFileRef& other);
    /// With or without a leading dot; empty removes the extension. The result denotes a file. Fails when the new name
    /// would have 1,024 bytes or more.
    bool ReplaceExtensionBy(const std::string& ext);

    bool IsValid() const { return valid_; }
    const platform::URLRef& URL() const { return url_; }

    /// The path without trailing slashes, owned by the URL: valid until the reference changes. Null when there is none:
    /// for a relative URL, and one of another host or scheme.
    const char* GetPath() const;
    /// True only when the whole path fitted; `buffer` is made empty first.
    bool GetPath(char* buffer, unsigned int size) const;
    operator const char*() const { return GetPath(); }
    operator std::string() const;
    /// POSIX for style 0; the Windows form for every other value, kColonPathStyle included.
    platform::String CopyFileSystemPath(tPathStyle style) const;

    platform::String CopyFileName() const;
    bool GetFileName(char* buffer, long size) const;
    bool UnicodeFileName(UnicodeName* name) const;
    /// Whether the name fits 1,024 bytes, its terminator included.
    bool HasValidName() const;
    bool GetExtension(std::string& extension) const;
    bool GetExtension(char* buffer, unsigned long size) const;
    platform::String CopyFileExtension() const;
    /// Without regard to ASCII case, with or without a leading dot.
    bool HasExtension(const std::string& ext) const;
    platform::String GetDisplayName() const;
    platform::String CopyDisplayName() const;

    /// Equal for items on one volume; null on failure.
    std::shared_ptr<const Bytes> GetVolumeID() const;
    CFileRef GetMountPoint() const;

    bool IsRoot() const;
    bool Exists() const;
    bool IsFile() const;
    bool IsFolder() const;
    bool IsExistingPackage() const;
    bool IsWritable() const;
    /// Whether `other` is equal to or inside this, without regard to ASCII case.
    bool PathContains(const CFileRef& other) const;

    /// Replaces an alias file or a symbolic link by its target; true only when the reference changed.
    bool ResolveAlias(bool allowUserInteraction);
    bool GetFSRef(platform::FileHandle* handle) const;
    bool UpdateInternalFSRef();

    /// A dictionary that SetFromPList takes; null when nothing could be stored.
    std::optional<platform::Dictionary> CreatePList(tCFileRefPListCreationType type) const;
    std::optional<Bytes> CreateBinaryPList(tCFileRefPListCreationType type) const;

    /// By the path with symbolic links resolved; invalid references are equal, and come last. All six are there
    /// because a missing one would compare the pointers that `operator const char*` gives.
    friend KT_EXPORT bool operator==(const CFileRef& a, const CFileRef& b);
    friend KT_EXPORT bool operator<(const CFileRef& a, const CFileRef& b);
    friend bool operator>(const CFileRef& a, const CFileRef& b) { return b < a; }
    friend bool operator<=(const CFileRef& a, const CFileRef& b) { return !(b < a); }
    friend bool operator>=(const CFileRef& a, const CFileRef& b) { return !(a < b); }
    std::size_t hash() const;

    /// Writes the path and whether it exists to standard output.
    void Trace() const;

private:
    bool SetTildePath(const platform::String& path, bool isDirectory);

    platform::URLRef url_;
    bool valid_ = false;
    std::unique_ptr<platform::FileHandle> fileHandle_; // cache of UpdateInternalFSRef; null is all zero
};
