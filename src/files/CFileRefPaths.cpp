// The path of a reference, its name and extension, and paths derived from it.
#include "files/CFileRef.h"

#include "platform/core/ASCIICase.h"

#include <algorithm>
#include <cstring>
#include <string_view>

using platform::PathStyle;
using platform::String;
using platform::URLRef;

namespace {

constexpr std::size_t kNameBufferSize = 1024;
constexpr std::size_t kLongestComparedExtension = 19;

/// The extension in a name: the text after the last dot, even if it is empty or the dot comes first; null if there is
/// no dot.
/// nothing comes before.
const char* extensionIn(const char* name)
{
    const char* dot = std::strrchr(name, '.');
    return dot == nullptr ? nullptr : dot + 1;
}

/// One leading dot is not part of an extension.
std::string_view withoutLeadingDot(std::string_view extension)
{
    if (extension.starts_with('.'))
        extension.remove_prefix(1);
    return extension;
}

} // namespace

const char* CFileRef::GetPath() const
{
    // A URL with a base has an absolute path, though not one of its own; one of another host or scheme has none.
    if (!valid_ || !url_->hasAbsolutePath() || url_->posixPath().empty())
        return nullptr;
    return url_->posixPath().c_str();
}

bool CFileRef::GetPath(char* buffer, unsigned int size) const
{
    if (buffer == nullptr || size == 0)
        return false;
    buffer[0] = '\0';
    const char* path = GetPath();
    const std::size_t length = path == nullptr ? 0 : std::strlen(path);
    if (path == nullptr || length >= size)
        return false;
    std::memcpy(buffer, path, length + 1);
    return true;
}

CFileRef::operator std::string() const
{
    const char* path = GetPath();
    return path == nullptr ? std::string() : std::string(path);
}

String CFileRef::CopyFileSystemPath(tPathStyle style) const
{
    if (!valid_)
        return nullptr;
    // Kept: asking for the colon style gives the Windows form
    return url_->copyFileSystemPath(style == kPOSIXPathStyle ? PathStyle::posix : PathStyle::windows);
}

bool CFileRef::AddToPath(const char* component, bool isDirectory)
{
    return AddToPath(String::fromFileSystemRepresentation(component), isDirectory);
}

bool CFileRef::AddToPath(const String& component, bool isDirectory)
{
    if (!valid_ || component.isNull())
        return SetTildePath(component, isDirectory);
    const std::string& folder = url_->posixPath();
    if (folder.empty())
        return Set(URLRef());
    return SetTildePath(String::fromUTF8(folder + '/' + component.utf8()), isDirectory);
}

bool CFileRef::AddToPath(const CFileRef& other)
{
    if (!valid_ || !other.valid_)
        return Set(URLRef());
    return AddToPath(other.CopyFileName(), other.url_->hasDirectoryPath());
}

bool CFileRef::SetToParent()
{
    if (!valid_)
        return false;
    const URLRef parent = url_->deletingLastPathComponent();
    if (!parent || parent->posixPath().empty() || parent->posixPath() == ".")
        return Set(URLRef());
    return Set(parent, true);
}

bool CFileRef::ReplaceName(const char* name, bool isDirectory)
{
    return ReplaceName(String::fromFileSystemRepresentation(name), isDirectory);
}

bool CFileRef::ReplaceName(const String& name, bool isDirectory)
{
    // Without a name the result would be the parent instead of an item in it.
    if (name.isEmpty() || (!valid_ && isDirectory))
        return Set(URLRef());
    if (!valid_)
        return SetTildePath(name, false);
    const URLRef parent = url_->deletingLastPathComponent();
    return Set(parent ? parent->appendingPathComponent(name, isDirectory) : nullptr);
}

bool CFileRef::ReplaceName(const CFileRef& other)
{
    if (!other.valid_)
        return Set(URLRef());
    return ReplaceName(other.CopyFileName(), other.url_->hasDirectoryPath());
}

bool CFileRef::ReplaceExtensionBy(const std::string& ext)
{
    char buffer[kNameBufferSize];
    if (!GetFileName(buffer, sizeof buffer))
        return Set(URLRef());
    const std::string_view replacement = withoutLeadingDot(ext);
    std::string name = buffer;
    if (const std::size_t dot = name.rfind('.'); dot != name.npos)
        name.resize(dot);
    if (!replacement.empty())
        (name += '.') += replacement;
    // A name too long for GetFileName has no extension either.
    return name.size() < kNameBufferSize ? ReplaceName(String::fromUTF8(name), false) : Set(URLRef());
}

String CFileRef::CopyFileName() const
{
    return valid_ ? url_->copyLastPathComponent() : nullptr;
}

bool CFileRef::GetFileName(char* buffer, long size) const
{
    if (buffer == nullptr || size <= 0)
        return false;
    buffer[0] = '\0';
    const String name = CopyFileName();
    if (!name.isNull() || !valid_)
        return name.getFileSystemRepresentation(buffer, static_cast<std::size_t>(size));
    const std::string& path = url_->posixPath(); // present if the URL was made from bytes
    const std::string_view bytes = std::string_view(path).substr(path.rfind('/') + 1);
    if (bytes.empty() || bytes.size() >= static_cast<std::size_t>(size))
        return false;
    buffer[bytes.copy(buffer, bytes.size())] = '\0';
    return true;
}

bool CFileRef::UnicodeFileName(UnicodeName* name) const
{
    if (name == nullptr || !valid_)
        return false;
    String text = fileHandle_ ? platform::catalogName(*fileHandle_) : nullptr;
    if (text.isNull())
        text = CopyFileName();
    const std::u16string units = text.utf16();
    if (text.isNull() || units.size() >= 256)
        return false;
    name->length = static_cast<std::uint16_t>(units.size());
    std::copy(units.begin(), units.end(), name->unicode);
    return true;
}

bool CFileRef::HasValidName() const
{
    char name[kNameBufferSize];
    return GetFileName(name, sizeof name);
}

bool CFileRef::GetExtension(std::string& extension) const
{
    char name[kNameBufferSize];
    const char* found = GetFileName(name, sizeof name) ? extensionIn(name) : nullptr;
    if (found == nullptr)
        return false;
    extension = found;
    return true;
}

bool CFileRef::GetExtension(char* buffer, unsigned long size) const
{
    std::string extension;
    if (buffer == nullptr || !GetExtension(extension) || extension.size() >= size)
        return false;
    std::memcpy(buffer, extension.c_str(), extension.size() + 1);
    return true;
}

String CFileRef::CopyFileExtension() const
{
    return valid_ ? url_->copyPathExtension() : nullptr;
}

bool CFileRef::HasExtension(const std::string& ext) const
{
    std::string own;
    if (ext.empty() || !GetExtension(own) || own.size() > kLongestComparedExtension)
        return false;
    return equalIgnoringASCIICase(own, withoutLeadingDot(ext));
}
