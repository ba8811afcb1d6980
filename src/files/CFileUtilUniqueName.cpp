#include "files/CFileUtilUniqueName.h"

#include "files/CFileUtil.h"
#include "platform/SystemCalls.h"
#include "platform/core/Status.h"

using platform::String;

namespace {

/// Here a leading "~" is part of the name.
platform::URLRef urlOf(const String& path)
{
    return platform::URL::createWithFileSystemPath(path, platform::PathStyle::posix, /*isDirectory=*/false);
}

/// The candidates for a path, in order.
class Candidates {
public:
    Candidates(const String& path, const String& separator) : separator_(separator.utf8())
    {
        const platform::URLRef url = urlOf(path);
        if (!url)
            return;
        current_ = stem_ = url->posixPath();
        const String extension = url->copyPathExtension();
        if (!extension.isNull()) {
            extension_ = '.' + extension.utf8();
            stem_.resize(stem_.size() - extension_.size());
        }
    }

    /// Empty if the path is invalid.
    const std::string& current() const { return current_; }
    void next() { current_ = stem_ + separator_ + std::to_string(++number_) + extension_; }

private:
    std::string separator_;
    std::string stem_;
    std::string extension_; // with its dot
    std::string current_;
    std::uint64_t number_ = 0;
};

/// A dangling link takes its name too.
bool isTaken(const std::string& path)
{
    platform::FileStatus status;
    return platform::systemCalls().linkStatus(path.c_str(), &status);
}

} // namespace

String CFileUtilCreateUniqueFileName(const String& path, const String& separator)
{
    Candidates candidates(path, separator);
    if (candidates.current().empty())
        return nullptr;
    if (!isTaken(candidates.current()))
        return path;
    do
        candidates.next();
    while (isTaken(candidates.current()));
    return String::fromUTF8(candidates.current());
}

std::int32_t CFileUtilCreateUniqueFile(const String& path, const String& separator, std::uint32_t permissions,
                                       String* created)
{
    if (created != nullptr)
        *created = nullptr;
    Candidates candidates(path, separator);
    if (candidates.current().empty())
        return kStatusParameterError;
    std::int32_t status = kStatusDuplicateName;
    for (; status == kStatusDuplicateName; candidates.next()) {
        const String candidate = String::fromUTF8(candidates.current());
        status = CFileUtilCreate(CFileRef(urlOf(candidate)), 0, 0, permissions);
        if (status == kStatusOK && created != nullptr)
            *created = candidate;
    }
    return status;
}
