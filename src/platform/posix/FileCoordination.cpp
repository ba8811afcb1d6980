#include "platform/FileCoordination.h"

#include "platform/FileSystem.h"
#include "platform/core/Status.h"
#include "platform/posix/AbsolutePath.h"
#include "platform/posix/ItemAccess.h"
#include "platform/posix/PresenterRegistry.h"

#include <algorithm>
#include <cerrno>
#include <deque>
#include <memory>
#include <system_error>

namespace platform {

namespace {

bool failOf(const std::system_error& failure, Error* error)
{
    return fail(error, ErrorDomain::system, failure.code().value(), failure.what());
}

bool failOfInvalidItem(Error* error)
{
    return fail(error, ErrorDomain::status, kStatusBadReference, "file coordination: a URL without a path");
}

/// One access in each folder in which others may look; mostly there is one.
struct OpenAccess final : CoordinatedAccess {
    OpenAccess(const CoordinatedItem& coordinated, const FilePresenter* own) : CoordinatedAccess(coordinated.url())
    {
        for (auto& directory : CoordinationDirectory::all())
            places.emplace_back(std::move(directory), coordinated.key(), own);
    }

    bool isSeen()
    {
        return std::all_of(places.begin(), places.end(), [](ItemAccess& place) { return place.isSeen(); });
    }

    std::deque<ItemAccess> places;
};

std::optional<SHA256Digest> keyOf(const URL& url)
{
    if (const String path = String::fromUTF8(absolutePath(url)); !path.isNull())
        return fileSystemRepresentationSHA256(resolvingSymbolicLinksInPath(path));
    const URLRef resolved = resolvingSymbolicLinks(url);
    return sha256(bytesOf(resolved ? resolved->posixPath() : absolutePath(url)));
}

} // namespace

CoordinatedItem::CoordinatedItem(URLRef url) : url_(std::move(url))
{
    if (!url_ || absolutePath(*url_).empty())
        return;
    const auto key = keyOf(*url_);
    isValid_ = key.has_value();
    if (key)
        key_ = *key;
}

FilePresenter::~FilePresenter()
{
    FileCoordinator::removeFilePresenter(*this);
}

CoordinatedAccess::~CoordinatedAccess() = default;

bool FileCoordinator::coordinateReading(const CoordinatedItem& item, ReadingOptions, const Accessor& accessor,
                                        Error* error) const
{
    return coordinate(item, Kind::reading, accessor, error);
}

bool FileCoordinator::coordinateWriting(const CoordinatedItem& item, WritingOptions, const Accessor& accessor,
                                        Error* error) const
{
    return coordinate(item, Kind::writing, accessor, error); // replacing asks everybody the same as writing
}

bool FileCoordinator::coordinateAcquiring(const CoordinatedItem& item, const Accessor& accessor, Error* error) const
{
    return coordinate(item, Kind::acquiring, accessor, error);
}

std::unique_ptr<CoordinatedAccess> FileCoordinator::openForReading(const CoordinatedItem& item, ReadingOptions,
                                                                   Error* error) const
{
    return open(item, Kind::reading, error);
}

std::unique_ptr<CoordinatedAccess> FileCoordinator::openForWriting(const CoordinatedItem& item, WritingOptions,
                                                                   Error* error) const
{
    return open(item, Kind::writing, error);
}

std::unique_ptr<CoordinatedAccess> FileCoordinator::tryToOpenForReading(const CoordinatedItem& item) const
{
    return tryToOpen(item, Kind::reading);
}

std::unique_ptr<CoordinatedAccess> FileCoordinator::tryToOpenForWriting(const CoordinatedItem& item) const
{
    return tryToOpen(item, Kind::writing);
}

std::unique_ptr<CoordinatedAccess> FileCoordinator::tryToOpen(const CoordinatedItem& item, Kind kind) const
{
    if (!item.isValid())
        return nullptr;
    try {
        auto access = std::make_unique<OpenAccess>(item, presenter_.get());
        const bool isHad = std::all_of(access->places.begin(), access->places.end(), [&](ItemAccess& place) {
            return kind == Kind::reading ? place.tryToAcquireForReading() : place.tryToAcquireForWriting();
        });
        return isHad && access->isSeen() ? std::move(access) : nullptr;
    } catch (const std::system_error&) {
        return nullptr;
    }
}

bool FileCoordinator::coordinate(const CoordinatedItem& item, Kind kind, const Accessor& accessor, Error* error) const
{
    const std::unique_ptr<CoordinatedAccess> access = open(item, kind, error);
    if (access)
        accessor(access->url());
    return access != nullptr;
}

std::unique_ptr<CoordinatedAccess> FileCoordinator::open(const CoordinatedItem& item, Kind kind, Error* error) const
{
    if (!item.isValid()) {
        failOfInvalidItem(error);
        return nullptr;
    }
    for (;;) {
        std::shared_ptr<CoordinationDirectory> directory;
        try {
            directory = CoordinationDirectory::current();
            auto access = std::make_unique<OpenAccess>(item, presenter_.get());
            for (ItemAccess& place : access->places)
                if (kind == Kind::reading)
                    place.acquireForReading();
                else
                    place.acquireForWriting(kind == Kind::writing);
            if (access->isSeen())
                return access;
            // Otherwise nobody there would ask the presenter that acquires this.
            PresenterRegistry::shared().followFolder();
        } catch (const std::system_error& failure) {
            if (failure.code().value() != ESTALE && (!directory || directory->isCurrent())) {
                failOf(failure, error);
                return nullptr;
            }
        }
    }
}

bool FileCoordinator::addFilePresenter(const std::shared_ptr<FilePresenter>& presenter, AskedBy askedBy, Error* error)
{
    const CoordinatedItem item(presenter->presentedItemURL());
    if (!item.isValid())
        return failOfInvalidItem(error);
    try {
        PresenterRegistry::shared().add(presenter, item.key(), askedBy);
        return true;
    } catch (const std::system_error& failure) {
        return failOf(failure, error);
    }
}

void FileCoordinator::removeFilePresenter(const FilePresenter& presenter)
{
    PresenterRegistry::shared().remove(presenter);
}

bool FileCoordinator::setAskedBy(const FilePresenter& presenter, AskedBy askedBy, Error* error)
{
    try {
        PresenterRegistry::shared().setAskedBy(presenter, askedBy);
        return true;
    } catch (const std::system_error& failure) {
        return failOf(failure, error);
    }
}

void FileCoordinator::setCoordinationFolder(const std::string& path)
{
    CoordinationDirectory::setPath(path);
}

} // namespace platform
