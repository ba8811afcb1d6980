// Making, copying and setting references.
#include "files/CFileRef.h"

using platform::PathStyle;
using platform::String;
using platform::URLRef;

constinit const CFileRef CFileRef::None;
constinit platform::TextEncoding CFileRef::mLocalEncoding = platform::kTextEncodingWestern;

CFileRef::CFileRef(const char* path, bool isDirectory)
{
    Set(path, isDirectory);
}

CFileRef::CFileRef(const String& path, tPathStyle style, bool isDirectory)
{
    Set(path, style, isDirectory);
}

CFileRef::CFileRef(const String& folder, const String& name)
{
    Set(folder, name);
}

CFileRef::CFileRef(URLRef url)
{
    Set(std::move(url));
}

CFileRef::CFileRef(const CFileRef& other) : url_(other.url_), valid_(other.valid_)
{
}

CFileRef& CFileRef::operator=(const CFileRef& other)
{
    if (this != &other) {
        ReInit();
        url_ = other.url_;
        valid_ = other.valid_;
    }
    return *this;
}

CFileRef::~CFileRef() = default;

void CFileRef::ReInit()
{
    url_.reset();
    valid_ = false;
    fileHandle_.reset();
}

// Setters copy what they need before they reset, because the argument may be this reference's own path or URL.

bool CFileRef::Set(const char* path, bool isDirectory)
{
    return SetTildePath(String::fromFileSystemRepresentation(path), isDirectory);
}

bool CFileRef::Set(const String& path, tPathStyle style, bool isDirectory)
{
    switch (style) {
    case kPOSIXPathStyle:
        return SetTildePath(path, isDirectory);
    case kWindowsPathStyle:
        return Set(platform::URL::createWithFileSystemPath(path, PathStyle::windows, isDirectory));
    default: // Kept: colon paths enter only through SetFromColonPath
        ReInit();
        return false;
    }
}

bool CFileRef::Set(const String& folder, const String& name)
{
    if (folder.isNull() || name.isNull())
        return SetTildePath(folder, true);
    std::string text = folder.utf8();
    if (!text.empty())
        text += '/';
    return SetTildePath(String::fromUTF8(text += name.utf8()), false);
}

bool CFileRef::Set(URLRef url)
{
    if (valid_ && url == url_)
        return true;
    ReInit();
    url_ = std::move(url);
    valid_ = url_ != nullptr;
    return valid_;
}

bool CFileRef::Set(const URLRef& url, bool isDirectory)
{
    const String path = url ? url->copyFileSystemPath(PathStyle::posix) : nullptr;
    return Set(platform::URL::createWithFileSystemPath(path, PathStyle::posix, isDirectory));
}

bool CFileRef::Set(const CFileRef& other, bool isDirectory)
{
    return Set(other.url_, isDirectory);
}

bool CFileRef::Set(const platform::FileHandle* handle)
{
    return Set(handle != nullptr ? platform::urlFromFileHandle(*handle) : nullptr);
}

bool CFileRef::SetFromColonPath(const char* path, bool isDirectory)
{
    String text = platform::decodeCString(path, mLocalEncoding);
    if (text.isNull())
        text = platform::decodeCString(path, platform::systemTextEncoding());
    if (text.isNull() && path != nullptr) // one zero byte surely ends the text; looking for two would read past it
        text = platform::decodeText(path, platform::kTextEncodingUnicode16);
    return Set(platform::URL::createWithFileSystemPath(text, PathStyle::colon, isDirectory));
}

bool CFileRef::SetFromURLString(const std::string& url)
{
    return Set(platform::URL::createWithString(url));
}

/// Sets a POSIX path whose leading "~" or "~user" stands for a home folder.
bool CFileRef::SetTildePath(const String& path, bool isDirectory)
{
    const std::string& text = path.utf8();
    if (!text.starts_with('~'))
        return Set(platform::URL::createWithFileSystemPath(path, PathStyle::posix, isDirectory));

    const std::size_t slash = text.find('/');
    const String home = platform::homeDirectory(text.substr(1, slash == text.npos ? slash : slash - 1));
    const std::string remainder = slash == text.npos ? std::string() : text.substr(slash + 1);
    if (home.isNull() || remainder.empty())
        return Set(platform::URL::createWithFileSystemPath(home, PathStyle::posix, true));
    return Set(platform::URL::createWithFileSystemPath(String::fromUTF8(home.utf8() + '/' + remainder),
                                                       PathStyle::posix, isDirectory));
}
