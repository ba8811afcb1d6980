#include "platform/URL.h"

#include "platform/core/ASCIICase.h"
#include "platform/uriparser/PathStyles.h"
#include "platform/uriparser/URIText.h"

#include <algorithm>
#include <functional>
#include <tuple>
#include <utility>

namespace platform {

struct URL::Rest {
    std::string otherText;        // the whole text, if the scheme is another
    bool hasAbsolutePath = false; // whether otherText has one
    std::string host;             // in lower case; empty for this system
    std::string suffix;           // query and fragment
    std::string relativePath;     // decoded; the path in the text of a URL with a base
    URLRef base;

    bool isEmpty() const { return otherText.empty() && host.empty() && suffix.empty() && !base; }
};

namespace {

constexpr std::string_view kScheme = "file://";

/// The path with runs of slashes made one, and no trailing slash except the root's.
std::string withSingleSlashes(std::string_view path)
{
    std::string result;
    if (path.find("//") == path.npos)
        result = path;
    else
        std::unique_copy(path.begin(), path.end(), std::back_inserter(result),
                         [](char a, char b) { return a == '/' && b == '/'; });
    if (result.size() > 1 && result.back() == '/')
        result.pop_back();
    return result;
}

std::string_view lastComponent(std::string_view path)
{
    return path.size() == 1 ? path : path.substr(path.rfind('/') + 1);
}

bool isDots(std::string_view component)
{
    return component == "." || component == "..";
}

/// An absolute path without "." and ".."; ".." at the root stays there.
std::string withoutDots(std::string_view path)
{
    std::string result;
    while (!path.empty()) {
        const std::size_t end = std::min(path.find('/', 1), path.size());
        const std::string_view component = path.substr(1, end - 1);
        if (component == "..")
            result.resize(std::min(result.rfind('/'), result.size()));
        else if (component != ".")
            result += path.substr(0, end);
        path.remove_prefix(end);
    }
    return result.empty() ? "/" : result;
}

bool canNameFile(const URIReference& parsed, bool hasBase)
{
    const bool needsAbsolutePath = !parsed.scheme.empty() || parsed.hasAuthority;
    const bool needsBase = parsed.scheme.empty() && parsed.hasAuthority;
    return parsed.path && !parsed.path->empty() && !parsed.hasUserOrPort &&
           (parsed.host.empty() || isHostName(parsed.host)) && (parsed.isAbsolutePath || !needsAbsolutePath) &&
           (hasBase || !needsBase);
}

} // namespace

URL::URL(Creation, std::string path, bool isDirectory, std::unique_ptr<const Rest> rest)
    : path_(std::move(path)),
      isDirectory_(isDirectory),
      rest_(std::move(rest))
{
}

URL::~URL() = default;

/// `path` has single slashes. If it is relative and `rest` has a base, the base is applied here.
URLRef URL::create(std::string path, bool isDirectory, Rest rest)
{
    isDirectory = isDirectory || path == "/" || isDots(lastComponent(path));
    if (path.starts_with('/'))
        rest.base = nullptr;
    if (rest.base) {
        const URL& base = *rest.base;
        if (base.isOfOtherScheme())
            return nullptr;
        std::string folder = base.path_;
        if (!base.isDirectory_)
            folder.resize(folder.rfind('/') + 1);
        else if (folder != "/")
            folder += '/';
        rest.host = base.rest_ ? base.rest_->host : std::string();
        rest.relativePath = std::exchange(path, folder + path);
        if (path.starts_with('/'))
            path = withoutDots(path);
    }
    return std::make_shared<const URL>(Creation{}, std::move(path), isDirectory,
                                       rest.isEmpty() ? nullptr : std::make_unique<const Rest>(std::move(rest)));
}

URLRef URL::createWithFileSystemPath(const String& path, PathStyle style, bool isDirectory, URLRef base)
{
    const std::string& text = path.utf8();
    if (text.empty() || text.find('\0') != text.npos)
        return nullptr;
    Rest rest;
    rest.base = std::move(base);
    switch (style) {
    case PathStyle::posix:
        return create(withSingleSlashes(text), isDirectory, std::move(rest));
    case PathStyle::colon: {
        const std::optional<std::string> read = readColonPath(text);
        return read ? create(withSingleSlashes(*read), isDirectory, std::move(rest)) : nullptr;
    }
    case PathStyle::windows: {
        std::optional<HostPath> read = readWindowsPath(text);
        if (!read)
            return nullptr;
        if (read->host != "localhost")
            rest.host = std::move(read->host);
        return create(withSingleSlashes(read->path), isDirectory, std::move(rest));
    }
    }
    return nullptr;
}

URLRef URL::createWithFileSystemBytes(std::string_view path, bool isDirectory)
{
    const bool isPath = path.starts_with('/') && path.find('\0') == path.npos;
    return isPath ? create(withSingleSlashes(path), isDirectory, {}) : nullptr;
}

URLRef URL::createWithString(std::string_view utf8, URLRef base)
{
    if (String::fromUTF8(utf8).isNull())
        return nullptr;
    std::optional<URIReference> parsed = parseURIReference(utf8);
    if (!parsed)
        return nullptr;
    Rest rest;
    if (!parsed->scheme.empty() && parsed->scheme != "file") {
        rest.otherText = withEscapesBeyondASCII(utf8);
        rest.hasAbsolutePath = parsed->isAbsolutePath;
        return std::make_shared<const URL>(Creation{}, std::string(), parsed->endsInSlash,
                                           std::make_unique<const Rest>(std::move(rest)));
    }

    if (!canNameFile(*parsed, base != nullptr))
        return nullptr;
    if (parsed->scheme.empty() && base) {
        if (base->isOfOtherScheme())
            return nullptr;
        if (!parsed->hasAuthority && base->rest_)
            rest.host = base->rest_->host;
        rest.base = std::move(base);
    }
    std::transform(parsed->host.begin(), parsed->host.end(), parsed->host.begin(), asciiLower);
    if (parsed->hasAuthority)
        rest.host = parsed->host == "localhost" ? std::string() : std::move(parsed->host);
    rest.suffix = std::move(parsed->suffix);
    return create(withSingleSlashes(*parsed->path), parsed->endsInSlash, std::move(rest));
}

bool URL::isOfOtherScheme() const
{
    return path_.empty();
}

/// The path that stands in the URL's text.
const std::string& URL::ownPath() const
{
    return rest_ && rest_->base ? rest_->relativePath : path_;
}

/// The text of this URL with `path` in place of its own.
std::string URL::textOfPath(const std::string& path) const
{
    if (isOfOtherScheme())
        return rest_->otherText;
    std::string text = percentEncodedPath(path);
    if (path.starts_with('/'))
        text.insert(0, kScheme).insert(kScheme.size(), rest_ ? rest_->host : std::string());
    if (isDirectory_ && path != "/")
        text += '/';
    return rest_ ? text + rest_->suffix : text;
}

std::string URL::string() const
{
    return textOfPath(ownPath());
}

std::string URL::absoluteString() const
{
    return textOfPath(path_);
}

URLRef URL::baseURL() const
{
    return rest_ ? rest_->base : nullptr;
}

bool URL::isFileURL() const
{
    return path_.starts_with('/');
}

bool URL::isFileReferenceURL() const
{
    return posixPath().starts_with("/.file/id=");
}

bool URL::hasAbsolutePath() const
{
    return isOfOtherScheme() ? rest_->hasAbsolutePath : ownPath().starts_with('/');
}

const std::string& URL::posixPath() const
{
    static const std::string none;
    return rest_ && !rest_->host.empty() ? none : path_;
}

String URL::copyFileSystemPath(PathStyle style) const
{
    const std::string host = rest_ ? rest_->host : std::string();
    if (isOfOtherScheme() || (!host.empty() && style != PathStyle::windows))
        return nullptr;
    if (style == PathStyle::posix)
        return String::fromUTF8(path_);
    const std::optional<std::string> text = style == PathStyle::windows ? windowsPath(host, path_) : colonPath(path_);
    return text ? String::fromUTF8(*text) : String();
}

String URL::copyLastPathComponent() const
{
    return isOfOtherScheme() ? String() : String::fromUTF8(lastComponent(path_));
}

String URL::copyPathExtension() const
{
    const std::string_view name = lastComponent(path_);
    const std::size_t dot = name.rfind('.');
    if (dot == name.npos || dot == 0 || dot + 1 == name.size() || name.find(' ', dot) != name.npos)
        return nullptr;
    return String::fromUTF8(name.substr(dot + 1));
}

/// A URL of another item with the same base, or on the same host.
URLRef URL::withPath(std::string path, bool isDirectory) const
{
    Rest rest;
    if (rest_) {
        rest.host = rest_->host;
        rest.base = rest_->base;
    }
    return create(std::move(path), isDirectory, std::move(rest));
}

URLRef URL::deletingLastPathComponent() const
{
    if (isOfOtherScheme())
        return nullptr;
    const std::string& path = ownPath();
    const std::string_view last = lastComponent(path);
    const std::size_t slash = path.rfind('/');
    if (last == "..")
        return withPath(path + "/..", true);
    if (last == ".")
        return withPath(path + '.', true);
    if (slash == path.npos)
        return withPath(".", true);
    return withPath(path.substr(0, std::max<std::size_t>(slash, 1)), true);
}

URLRef URL::appendingPathComponent(const String& component, bool isDirectory) const
{
    std::string name = withSingleSlashes(component.utf8());
    if (name.starts_with('/'))
        name.erase(0, 1);
    if (isOfOtherScheme() || name.empty() || name.find('\0') != name.npos)
        return nullptr;
    const std::string& folder = ownPath();
    if (folder == ".")
        return withPath(std::move(name), isDirectory);
    return withPath(folder == "/" ? folder + name : folder + '/' + name, isDirectory);
}

bool operator==(const URL& a, const URL& b)
{
    if (a.path_ != b.path_ || a.isDirectory_ != b.isDirectory_ || !a.rest_ != !b.rest_)
        return false;
    if (!a.rest_)
        return true;
    const auto values = [](const URL::Rest& rest) {
        return std::tie(rest.otherText, rest.host, rest.suffix, rest.relativePath);
    };
    const URLRef &x = a.rest_->base, &y = b.rest_->base;
    return values(*a.rest_) == values(*b.rest_) && (x == y || (x && y && *x == *y));
}

std::size_t URL::hash() const
{
    const std::size_t hash = std::hash<std::string>{}(isOfOtherScheme() ? rest_->otherText : path_);
    return hash * 2 + (isDirectory_ ? 1 : 0);
}

} // namespace platform
